#pragma once
// Watches a simulated chain clock by clock (the waveform recorder does).

namespace jexsim {

class SimChain;

class ChainObserver {
public:
    virtual ~ChainObserver() = default;
    // After each rising TCK edge: the levels driven and the TDO sampled at
    // that edge; the devices are already in their new states.
    virtual void onClock(const SimChain& chain, bool tms, bool tdi, bool tdo) = 0;
};

} // namespace jexsim
