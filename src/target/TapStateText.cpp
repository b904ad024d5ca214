// SPDX-License-Identifier: MIT
#include "target/TapStateText.hpp"

#include <cstdio>

namespace JexRT {

namespace {

const char* const kStateNames[TapStateText::kTableSize] = {
    "JEXJTAG_TEST_LOGIC_RESET", "JEXJTAG_RUN_TEST_IDLE", "JEXJTAG_SELECT_DR_SCAN", "JEXJTAG_CAPTURE_DR",
    "JEXJTAG_SHIFT_DR",         "JEXJTAG_EXIT1_DR",      "JEXJTAG_PAUSE_DR",       "JEXJTAG_EXIT2_DR",
    "JEXJTAG_UPDATE_DR",        "JEXJTAG_SELECT_IR_SCAN", "JEXJTAG_CAPTURE_IR",    "JEXJTAG_SHIFT_IR",
    "JEXJTAG_EXIT1_IR",         "JEXJTAG_PAUSE_IR",      "JEXJTAG_EXIT2_IR",       "JEXJTAG_UPDATE_IR",
    "",
};

} // namespace

const char* TapStateText::tableName(unsigned state)
{
    return state < kTableSize ? kStateNames[state] : nullptr;
}

TapStateText::TapStateText(unsigned state) : m_text(tableName(state)), m_unknown{}
{
    if (m_text) return;
    std::snprintf(m_unknown, sizeof m_unknown, "unknown(%u)", state);
    m_text = m_unknown;
}

} // namespace JexRT
