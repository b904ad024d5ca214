// SPDX-License-Identifier: MIT
#pragma once
// SvfStates - the TAP states as SVF names them, the IEEE 1149.1 transitions
// and the default paths STATE and RUNTEST take between stable states.
// States are JexJtagTapState values.

#include <string>
#include <vector>

namespace JexRT {

class SvfStates {
public:
    // The state named `word` (upper case), or -1.
    static int byName(const std::string& word);
    static const char* name(unsigned state);
    static bool isStable(unsigned state);
    // The state one clock with `tms` leads to.
    static unsigned next(unsigned state, bool tms);
    // True when one clock leads from `from` to `to`; *tms receives its level.
    static bool step(unsigned from, unsigned to, bool* tms);
    // The states entered, one clock each, on the default path between two
    // stable states (empty when from == to, except a Pause to itself, which
    // goes round through Update and Capture).
    static std::vector<unsigned> defaultPath(unsigned from, unsigned to);
};

} // namespace JexRT
