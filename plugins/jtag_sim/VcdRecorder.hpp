// SPDX-License-Identifier: MIT
#pragma once
// Records what a simulated cable drives as a Value Change Dump (IEEE 1364
// VCD) that GTKWave and other waveform viewers open.
//
// Signals, in scope "jtag": tck, tms, tdi, tdo (wires), and per device a
// 4-bit "devN_state" holding the TAP state as numbered by JexJtagTapState
// (0 Test-Logic-Reset ... 15 Update-IR; the header's comment lists them) and
// a "devN_tap" string with the state's name ("Shift-DR"), a GTKWave
// extension of VCD that GTKWave shows as text.  Device 0 is nearest TDO.  Time unit 1 ps; a TCK cycle lasts 1/frequency:
// TCK low for the first half (TMS and TDI driven, TDO shows the bit sampled
// at the coming edge), high for the second (TAP states move at the rising
// edge).  Waits advance the time without clocks.

#include <cstdint>
#include <cstdio>
#include <string>
#include <vector>

#include "ChainObserver.hpp"

namespace jexsim {

class VcdRecorder : public ChainObserver {
public:
    // Creates (truncates) the file and writes the header for this chain.
    // Throws std::runtime_error when the file cannot be written.
    VcdRecorder(const std::string& path, const SimChain& chain, uint64_t frequencyHz, bool tdi);
    ~VcdRecorder() override;
    VcdRecorder(const VcdRecorder&) = delete;
    VcdRecorder& operator=(const VcdRecorder&) = delete;

    const std::string& path() const { return m_path; }
    uint64_t now() const { return m_time; }

    void onClock(const SimChain& chain, bool tms, bool tdi, bool tdo) override;
    // pinLevel(), then wait() and flush().
    void onPinLevel(const SimChain& chain, unsigned pin, bool level) override { pinLevel(pin, level, chain); }
    void onWait(uint64_t microseconds) override
    {
        wait(microseconds);
        flush();
    }
    // A pin driven without a clock edge (pin-level access); lasts half a cycle.
    void pinLevel(unsigned pin, bool level, const SimChain& chain);
    // Time passing without clocks.
    void wait(uint64_t microseconds);
    void setFrequency(uint64_t frequencyHz);
    // Hands buffered output to the file.  False when a write to the file
    // has failed, now or before (a full disk): the waveform is incomplete.
    bool flush();
    // False once a write to the file has failed.
    bool ok() const;
    // Writes the last time stamp and closes the file; false when anything
    // could not be written.  The destructor does it when not done.
    bool finish();
    // Throws std::runtime_error when a write has failed, and closes the file.
    void checkRecorded(bool flushFirst) override;

private:
    void change(unsigned signal, bool level);
    void changeState(std::size_t device, unsigned state);
    void stamp();

    std::string m_path;
    std::FILE* m_file = nullptr;
    uint64_t m_time = 0;
    uint64_t m_halfPeriod = 0;
    uint64_t m_stamped = ~uint64_t{0};
    bool m_levels[4] = {false, true, true, true}; // tck, tms, tdi, tdo
    std::vector<unsigned> m_states;
    std::vector<std::string> m_stateIds;
    std::vector<std::string> m_nameIds;
};

} // namespace jexsim
