// SPDX-License-Identifier: MIT
#pragma once
// Watches a simulated chain clock by clock (the waveform recorder does).

#include <cstdint>

namespace jexsim {

class SimChain;

class ChainObserver {
public:
    virtual ~ChainObserver() = default;
    // After each rising TCK edge: the levels driven and the TDO sampled at
    // that edge; the devices are already in their new states.
    virtual void onClock(const SimChain& chain, bool tms, bool tdi, bool tdo) = 0;
    // A level driven on TCK, TMS or TDI without a rising edge (pin access).
    virtual void onPinLevel(const SimChain& chain, unsigned pin, bool level) = 0;
    // Time passing without clocks (waitTime).
    virtual void onWait(uint64_t microseconds) = 0;
    // After the chain was driven: an observer that can no longer record
    // throws std::runtime_error saying why, once, and records nothing more.
    // `flushFirst`: hand buffered output on first (a flush or a wait).
    virtual void checkRecorded(bool flushFirst) { (void)flushFirst; }
};

} // namespace jexsim
