// SPDX-License-Identifier: MIT
#pragma once
// The wire side of the USB cable: the SDK's JtagTransport on an MPSSE queue.
// TMS moves, scans and idle clocks are queued as MPSSE commands; flush()
// sends them (one write, and one read when TDO is due) and fills the sinks.
// The reset lines and the profile's free GPIO pins go through the pin
// commands 0x80/0x82, their levels read back with 0x81/0x83.
//
// Own pins (setPin/getPin numbers above JEXJTAG_TCK): 16 + n is xDBUS n
// (n = 4..7), 24 + n is xCBUS n (n = 0..7); setting one makes it an output.
// Pins that carry the profile's reset signals are left to the "trst" and
// "srst" options.
//
// Failures throw std::runtime_error with the link's message; the queue is
// then emptied and the chip's buffers purged, so the next operation starts
// clean.

#include <cstdint>

#include "jexjtag/cable/JtagTransport.hpp"

#include "AdapterProfile.hpp"
#include "MpsseQueue.hpp"

namespace jexusb {

class MpsseTransport : public jexcable::JtagTransport {
public:
    static constexpr uint32_t kFirstLowPin = 16;  // xDBUS0 as a pin number
    static constexpr uint32_t kFirstHighPin = 24; // xCBUS0 as a pin number

    // Neither is owned; both must outlive the transport.
    MpsseTransport(MpsseQueue& queue, FtdiLink& link, const AdapterProfile& profile);

    void moveTms(const uint8_t* tms, uint32_t count, bool tdi) override;
    void shift(const jexcable::ShiftSource& in, const jexcable::ShiftSink& out, uint32_t count,
               bool tmsOnLast) override;
    void idleClocks(uint64_t count, bool tms, bool tdi) override;
    void flush() override;
    bool drivePin(uint32_t pin, bool level) override;
    bool readPin(uint32_t pin, bool& level) override;
    bool hasResetLines() const override { return m_profile->trst.present() || m_profile->srst.present(); }
    void setResetLines(bool trst, bool srst) override;

    // The 16-bit pin levels and directions the profile starts with, with
    // the reset lines released.
    static void initialPins(const AdapterProfile& profile, uint16_t& value, uint16_t& direction);

private:
    void applyPins(uint16_t value, uint16_t direction);
    bool ownPin(uint32_t pin, uint16_t& mask) const;

    MpsseQueue* m_queue;
    FtdiLink* m_link;
    const AdapterProfile* m_profile;
};

} // namespace jexusb
