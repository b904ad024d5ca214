// SPDX-License-Identifier: MIT
#include "svf/SvfStates.hpp"

#include "jexjtag/types.h"

namespace JexRT {

namespace {

const char* const kNames[JEXJTAG_STATE_SIZE] = {"RESET",   "IDLE",     "DRSELECT", "DRCAPTURE", "DRSHIFT",  "DREXIT1",
                                                "DRPAUSE", "DREXIT2",  "DRUPDATE", "IRSELECT",  "IRCAPTURE", "IRSHIFT",
                                                "IREXIT1", "IRPAUSE",  "IREXIT2",  "IRUPDATE"};

// [state][tms]
const unsigned kNext[JEXJTAG_STATE_SIZE][2] = {
    {JEXJTAG_RUN_TEST_IDLE, JEXJTAG_TEST_LOGIC_RESET}, {JEXJTAG_RUN_TEST_IDLE, JEXJTAG_SELECT_DR_SCAN},
    {JEXJTAG_CAPTURE_DR, JEXJTAG_SELECT_IR_SCAN},      {JEXJTAG_SHIFT_DR, JEXJTAG_EXIT1_DR},
    {JEXJTAG_SHIFT_DR, JEXJTAG_EXIT1_DR},              {JEXJTAG_PAUSE_DR, JEXJTAG_UPDATE_DR},
    {JEXJTAG_PAUSE_DR, JEXJTAG_EXIT2_DR},              {JEXJTAG_SHIFT_DR, JEXJTAG_UPDATE_DR},
    {JEXJTAG_RUN_TEST_IDLE, JEXJTAG_SELECT_DR_SCAN},   {JEXJTAG_CAPTURE_IR, JEXJTAG_TEST_LOGIC_RESET},
    {JEXJTAG_SHIFT_IR, JEXJTAG_EXIT1_IR},              {JEXJTAG_SHIFT_IR, JEXJTAG_EXIT1_IR},
    {JEXJTAG_PAUSE_IR, JEXJTAG_UPDATE_IR},             {JEXJTAG_PAUSE_IR, JEXJTAG_EXIT2_IR},
    {JEXJTAG_SHIFT_IR, JEXJTAG_UPDATE_IR},             {JEXJTAG_RUN_TEST_IDLE, JEXJTAG_SELECT_DR_SCAN},
};

// TMS levels of the default paths between the stable states, in the order
// RESET, IDLE, DRPAUSE, IRPAUSE.
const char* const kPathTms[4][4] = {
    {"", "0", "01010", "011010"},
    {"111", "", "1010", "11010"},
    {"11111", "110", "111010", "1111010"},
    {"11111", "110", "111010", "1111010"},
};

int stableIndex(unsigned state)
{
    switch (state) {
    case JEXJTAG_TEST_LOGIC_RESET: return 0;
    case JEXJTAG_RUN_TEST_IDLE: return 1;
    case JEXJTAG_PAUSE_DR: return 2;
    case JEXJTAG_PAUSE_IR: return 3;
    default: return -1;
    }
}

} // namespace

int SvfStates::byName(const std::string& word)
{
    for (unsigned s = 0; s < JEXJTAG_STATE_SIZE; ++s)
        if (word == kNames[s]) return static_cast<int>(s);
    return -1;
}

const char* SvfStates::name(unsigned state) { return state < JEXJTAG_STATE_SIZE ? kNames[state] : "?"; }

bool SvfStates::isStable(unsigned state) { return stableIndex(state) >= 0; }

unsigned SvfStates::next(unsigned state, bool tms) { return kNext[state % JEXJTAG_STATE_SIZE][tms ? 1 : 0]; }

bool SvfStates::step(unsigned from, unsigned to, bool* tms)
{
    for (int level = 0; level < 2; ++level)
        if (next(from, level != 0) == to) {
            if (tms) *tms = level != 0;
            return true;
        }
    return false;
}

std::vector<unsigned> SvfStates::defaultPath(unsigned from, unsigned to)
{
    std::vector<unsigned> states;
    const int a = stableIndex(from);
    const int b = stableIndex(to);
    if (a < 0 || b < 0) return states;
    unsigned at = from;
    for (const char* t = kPathTms[a][b]; *t; ++t) {
        at = next(at, *t == '1');
        states.push_back(at);
    }
    return states;
}

} // namespace JexRT
