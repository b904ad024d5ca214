// SPDX-License-Identifier: MIT
#pragma once
// The byte pipe to one MPSSE channel of an FTDI chip: what MpsseQueue needs
// of the USB side and nothing more.  LibFtdiLink implements it on libftdi1;
// benchmarks put a fake behind it to time command generation alone.

#include <cstddef>
#include <cstdint>
#include <string>

namespace jexusb {

class FtdiLink {
public:
    virtual ~FtdiLink() = default;

    // Sends all `size` bytes to the chip.  False with `error` set when the
    // transfer failed (unplugged, timed out).
    virtual bool write(const uint8_t* data, std::size_t size, std::string& error) = 0;
    // Reads exactly `size` bytes (the modem-status bytes of each USB packet
    // already removed), waiting at most `timeoutMs` in all.  False with
    // `error` set when they did not all come.
    virtual bool read(uint8_t* data, std::size_t size, unsigned timeoutMs, std::string& error) = 0;
    // Bytes that arrived beyond those read so far and wait on the host
    // (0 when none or unknown).  Used to notice unexpected answers.
    virtual std::size_t pending() const = 0;
    // Throws away what waits in both directions, on the chip and the host.
    virtual bool purge(std::string& error) = 0;
};

} // namespace jexusb
