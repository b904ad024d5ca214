// SPDX-License-Identifier: MIT
#pragma once
// The IEEE 1149.1 TAP state machine as `jexjtag serve` follows it: the next
// state for a TMS level, and whether a TMS sequence is the one shortest path
// between two states (the path any cable driver takes when asked to navigate
// there, so a client's moves along it can be handed over as one navigation).

#include <cstdint>

namespace jexjtag::serve {

class TapStateTable {
public:
    static unsigned next(unsigned state, bool tms);
    // Number of clocks on the shortest path from one state to another.
    static unsigned distance(unsigned from, unsigned to);
    // True when exactly one TMS sequence of distance(from, to) clocks leads
    // from `from` to `to`.
    static bool hasUniqueShortestPath(unsigned from, unsigned to);
    static bool isShift(unsigned state);
    // The states TMS can hold: Test-Logic-Reset (TMS 1), Run-Test/Idle,
    // Pause-DR, Pause-IR (TMS 0); the Shift states hold too but shift.
    static bool holds(unsigned state, bool tms);
};

} // namespace jexjtag::serve
