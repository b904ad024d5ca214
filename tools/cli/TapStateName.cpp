// SPDX-License-Identifier: MIT
#include "TapStateName.hpp"

#include <cctype>

#include "NumberText.hpp"
#include "UsageError.hpp"
#include "jexjtag/types.h"

namespace jexjtag::cli {

namespace {

const char* const kNames[JEXJTAG_STATE_SIZE] = {
    "TEST_LOGIC_RESET", "RUN_TEST_IDLE", "SELECT_DR_SCAN", "CAPTURE_DR", "SHIFT_DR",  "EXIT1_DR",
    "PAUSE_DR",         "EXIT2_DR",      "UPDATE_DR",      "SELECT_IR_SCAN", "CAPTURE_IR", "SHIFT_IR",
    "EXIT1_IR",         "PAUSE_IR",      "EXIT2_IR",       "UPDATE_IR"};

struct Alias {
    const char* name;
    unsigned state;
};
const Alias kAliases[] = {{"IDLE", JEXJTAG_RUN_TEST_IDLE},
                          {"RTI", JEXJTAG_RUN_TEST_IDLE},
                          {"RESET", JEXJTAG_TEST_LOGIC_RESET},
                          {"TLR", JEXJTAG_TEST_LOGIC_RESET}};

std::string normalised(const std::string& name)
{
    std::string text;
    for (const char c : name) text += c == '-' ? '_' : static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
    const std::string prefix = "JEXJTAG_";
    if (text.compare(0, prefix.size(), prefix) == 0) text.erase(0, prefix.size());
    return text;
}

} // namespace

unsigned parseTapState(const std::string& name)
{
    if (const auto number = parseUnsigned(name, JEXJTAG_STATE_SIZE - 1)) return *number;
    const std::string key = normalised(name);
    for (unsigned s = 0; s < JEXJTAG_STATE_SIZE; ++s)
        if (key == kNames[s]) return s;
    for (const Alias& alias : kAliases)
        if (key == alias.name) return alias.state;
    throw UsageError("'" + name + "' is not a TAP state; use one of " + tapStateNameList());
}

std::string tapStateName(unsigned state)
{
    if (state < JEXJTAG_STATE_SIZE) return kNames[state];
    return "STATE_" + std::to_string(state);
}

std::string tapStateNameList()
{
    std::string list;
    for (unsigned s = 0; s < JEXJTAG_STATE_SIZE; ++s) {
        if (s) list += ", ";
        list += kNames[s];
    }
    return list + " (or idle, reset)";
}

} // namespace jexjtag::cli
