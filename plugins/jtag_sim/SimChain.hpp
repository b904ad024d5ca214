// SPDX-License-Identifier: MIT
#pragma once
// A simulated scan chain: TDI enters the last device, each device's TDO
// feeds the device before it, and device 0's TDO is the chain's TDO (device
// 0 is nearest TDO; its IDCODE leaves first in a DR scan after reset).  A
// chain of no devices is a wire from TDI to TDO.
//
// It is the cable's transport: every call is done when it returns (nothing
// is queued).  moveTms() and clock() are TCK cycles one by one; shift() a run
// of cycles in a Shift state, which it moves 64 bits at a time through every
// device unless an observer wants to see each clock.  Pin levels and waits
// go to the observer; TDO can be read as a pin.
//
// It is also the board around parts made from BSDL files: a pin's level is
// what a part drives on its net, else what the board (SimBoard, read at each
// capture) sets for the net, else 0.

#include <cstdint>
#include <unordered_map>
#include <utility>
#include <vector>

#include "ChainObserver.hpp"
#include "DeviceSpec.hpp"
#include "jexjtag/cable/JtagTransport.hpp"
#include "SimBoard.hpp"
#include "SimDevice.hpp"

namespace jexsim {

class SimChain final : public jexcable::JtagTransport, public PinEnvironment {
public:
    // `board` (may be null; not owned) must outlive the chain.
    explicit SimChain(const std::vector<DeviceSpec>& devices, const SimBoard* board = nullptr);
    SimChain(const SimChain&) = delete;
    SimChain& operator=(const SimChain&) = delete;

    // The level of a part's pin now (see above).
    bool pinLevel(std::size_t device, int pin) const override;

    std::size_t size() const { return m_devices.size(); }
    const SimDevice& device(std::size_t index) const { return m_devices[index]; }
    // The level on the chain's TDO now, with TDI at `tdi` (matters only for
    // a chain of no devices).
    bool tdo(bool tdi) const { return m_devices.empty() ? tdi : m_devices.front().tdo(); }
    // TCK cycles so far.
    uint64_t cycles() const { return m_cycles; }
    bool lastTms() const { return m_lastTms; }
    bool lastTdi() const { return m_lastTdi; }

    // Clocks are reported to the observer (none: null); not owned.
    void setObserver(ChainObserver* observer) { m_observer = observer; }

    void moveTms(const uint8_t* tms, uint32_t count, bool tdi) override;
    void shift(const jexcable::ShiftSource& in, const jexcable::ShiftSink& out, uint32_t count,
               bool tmsOnLast) override;
    bool clock(bool tms, bool tdi) override;
    // TDI and TMS levels (TDI reaches TDO through a chain of no devices)
    // and TCK going low, for the observer.
    bool drivePin(uint32_t pin, bool level) override;
    // TDO only: the chain's output now.
    bool readPin(uint32_t pin, bool& level) override;
    void sleep(uint32_t microseconds) override;
    // Nothing is queued; the observer hands its output on.
    void flush() override;

private:
    bool inShiftState() const;
    void resolveBoard() const;
    static uint64_t key(std::size_t device, int pin) { return (uint64_t{device} << 32) | static_cast<uint32_t>(pin); }

    std::vector<SimDevice> m_devices;
    ChainObserver* m_observer = nullptr;
    uint64_t m_cycles = 0;
    bool m_lastTms = true;
    bool m_lastTdi = true;
    const SimBoard* m_board = nullptr;
    // The board resolved to pin indexes, rebuilt when its version changes.
    mutable uint64_t m_boardVersion = ~uint64_t{0};
    mutable std::unordered_map<uint64_t, std::size_t> m_netOf;             // pin -> net
    mutable std::vector<std::vector<std::pair<std::size_t, int>>> m_nets;  // net -> pins
    mutable std::unordered_map<uint64_t, bool> m_levels;                    // pin -> level set
};

} // namespace jexsim
