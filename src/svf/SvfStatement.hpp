// SPDX-License-Identifier: MIT
#pragma once
// SvfStatement - one SVF statement as read, before the sticky rules apply.
// The player reuses one object for every statement, so the vectors' storage
// is allocated once for the largest of them.

#include <cstdint>
#include <vector>

#include "svf/SvfBits.hpp"

namespace JexRT {

struct SvfStatement {
    enum class Kind { EndDR, EndIR, Frequency, HDR, HIR, TDR, TIR, SDR, SIR, RunTest, State, Trst };
    // Scan parameters, in the order of `given` and `vector`.
    enum Param { TDI = 0, TDO = 1, MASK = 2, SMASK = 3 };
    enum class TrstMode { On, Off, Z, Absent };

    Kind kind = Kind::State;
    uint64_t line = 0;

    // HDR HIR TDR TIR SDR SIR
    uint32_t length = 0;
    bool given[4] = {false, false, false, false};
    SvfBits vector[4];

    // ENDDR ENDIR (the state), STATE (the path, last one stable)
    std::vector<unsigned> states;

    // FREQUENCY: hz < 0 when no value was given
    double hz = -1;

    // RUNTEST; runState / endState -1 when not given, minTime / maxTime < 0
    // when not given
    int runState = -1;
    int endState = -1;
    bool hasCount = false;
    uint32_t runCount = 0;
    double minTime = -1;
    double maxTime = -1;

    // TRST
    TrstMode trst = TrstMode::Off;
};

} // namespace JexRT
