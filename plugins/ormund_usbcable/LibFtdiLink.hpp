// SPDX-License-Identifier: MIT
#pragma once
// An MPSSE channel of an attached FTDI chip, reached through libftdi1; and
// the listing of attached chips.
//
// Opening resets the channel, purges both FIFOs, sets the latency timer
// and switches the channel to MPSSE mode; closing (the destructor) returns
// it to its reset mode.  Every wait is bounded: each bulk transfer by 1 s
// (IN) or 2 s (OUT), reads of expected answers by the caller's timeout.
// Failures are reported in words a user can act on: no device, permission
// (naming the udev rule), the device in use, unplugged.

#include <cstdint>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include "FtdiLink.hpp"

struct ftdi_context;

namespace jexusb {

// One attached USB device as the listing found it.
struct UsbDevice {
    uint16_t vid = 0;
    uint16_t pid = 0;
    std::string manufacturer;
    std::string product;
    std::string serial;
    uint8_t bus = 0;
    std::string ports; // port path, "2.1"
    // "bus 1 port 2.1"
    std::string location() const { return "bus " + std::to_string(bus) + " port " + ports; }
};

class LibFtdiLink : public FtdiLink {
public:
    // The udev rule file shipped with the library, for messages.
    static constexpr const char* kUdevRule = "share/jexjtag/udev/60-jexjtag-ftdi.rules";

    // The attached devices with any of these USB ids, in bus order.  Strings
    // that cannot be read (no permission) are left empty; `warning` says so.
    static std::vector<UsbDevice> list(const std::vector<std::pair<uint16_t, uint16_t>>& ids, std::string& warning);

    // Opens `device` (found again by ids, bus and port) on `channel`
    // ('A'..'D') and enters MPSSE mode with the given latency timer.
    // Null with `error` set on failure.
    static std::unique_ptr<LibFtdiLink> open(const UsbDevice& device, char channel, unsigned latencyMs,
                                             std::string& error);
    ~LibFtdiLink() override;
    LibFtdiLink(const LibFtdiLink&) = delete;
    LibFtdiLink& operator=(const LibFtdiLink&) = delete;

    bool write(const uint8_t* data, std::size_t size, std::string& error) override;
    bool read(uint8_t* data, std::size_t size, unsigned timeoutMs, std::string& error) override;
    std::size_t pending() const override;
    bool purge(std::string& error) override;

    bool setLatency(unsigned ms, std::string& error);
    // "FT2232H", "FT232H", "FT4232H", "FT2232C/D", ...
    const std::string& chipName() const { return m_chip; }
    // An H chip: 60 MHz clock base, adaptive clocking.
    bool highSpeed() const { return m_highSpeed; }
    // The chip's IN FIFO: the most answer bytes one transaction may wait on.
    std::size_t readWindow() const { return m_window; }
    // libftdi1's version text ("1.5").
    static std::string libraryVersion();

private:
    explicit LibFtdiLink(ftdi_context* context) : m_ctx(context) {}
    std::string failure(const char* what) const;

    ftdi_context* m_ctx;
    std::string m_chip;
    bool m_highSpeed = true;
    std::size_t m_window = 4096;
};

} // namespace jexusb
