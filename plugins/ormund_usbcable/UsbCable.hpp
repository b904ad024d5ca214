// SPDX-License-Identifier: MIT
#pragma once
// The USB cable: a plug-in instance of target type "ormund_usbcable", for
// JTAG adapters built on FTDI's MPSSE chips (FT2232C/D, FT2232H, FT4232H,
// FT232H), reached through libftdi1.  The SDK's CableBase does the plug-in
// operations; this class picks and opens the adapter, sets up its MPSSE
// engine and supplies the transport, the lock key, the target information
// and the options.
//
// Open arguments (all optional; without any, the first attached adapter
// that a profile recognises):
//   cable=PROFILE   an adapter profile (AdapterProfile), e.g. olimex-arm-usb-tiny-h
//   vid=, pid=      USB ids (hex, 0x optional); default: the profile's, else
//                   those of every profile
//   serial=TEXT     the adapter's USB serial number
//   index=N         the N-th matching adapter, from 0 (default 0)
//   channel=A..D    the MPSSE channel (default: the profile's)
//   frequency=F     TCK in Hz, k or M suffix (default 1M); the highest TCK
//                   not above F is used
//   latency=MS      the chip's latency timer, 1..255 (default 2)
//   adaptive=0|1    adaptive clocking on RTCK (H chips)
// Options (sendCommand get/set): frequency (get: the actual TCK), adaptive,
// latency, trst, srst; get only: cable, chip, serial, location.
//
// The lock is per adapter: "ftdi-<serial>", or "ftdi-bus<B>-<ports>" for an
// adapter without a serial number.

#include <memory>
#include <string>

#include "jexjtag/cable/CableBase.hpp"

#include "AdapterProfile.hpp"
#include "LibFtdiLink.hpp"
#include "MpsseQueue.hpp"
#include "MpsseTransport.hpp"

namespace jexusb {

class UsbCable : public jexcable::CableBase {
public:
    UsbCable();
    ~UsbCable() override;

    // Reads "10M", "500k", "1000000" (Hz); false when it is not a positive
    // frequency up to 100 MHz.
    static bool parseFrequency(const std::string& text, uint32_t& hz);

protected:
    uint32_t openCable(const jexcable::PluginArgs& args) override;
    void closeCable() override;
    std::string lockKey() const override;
    void describe(JexJtagTargetInfo& info) override;
    OptionStatus getOption(const std::string& key, std::string& value) override;
    OptionStatus setOption(const std::string& key, const std::string& value) override;

private:
    bool setUp(std::string& error);
    bool applyAdaptive(bool on, std::string& error);
    bool probe(std::string& error);

    UsbDevice m_device;
    const AdapterProfile* m_profile = nullptr;
    char m_channel = 'A';
    uint32_t m_requestedHz = 1000000;
    uint32_t m_actualHz = 0;
    unsigned m_latencyMs = 2;
    bool m_adaptive = false;
    std::unique_ptr<LibFtdiLink> m_link;
    std::unique_ptr<MpsseQueue> m_queue;
    std::unique_ptr<MpsseTransport> m_transport;
};

} // namespace jexusb
