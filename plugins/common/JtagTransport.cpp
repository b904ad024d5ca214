// SPDX-License-Identifier: MIT
#include "jexjtag/cable/JtagTransport.hpp"

#include <stdexcept>

#include "jexjtag/cable/PluginPlatform.hpp"
#include "jexjtag/types.h"

namespace jexcable {

void JtagTransport::idleClocks(uint64_t count, bool tms, bool tdi)
{
    uint8_t block[64];
    for (uint8_t& b : block) b = tms ? 0xFF : 0x00;
    constexpr uint32_t kBlockBits = sizeof(block) * 8;
    while (count > 0) {
        const uint32_t n = count > kBlockBits ? kBlockBits : static_cast<uint32_t>(count);
        moveTms(block, n, tdi);
        count -= n;
    }
}

bool JtagTransport::clock(bool tms, bool tdi)
{
    uint8_t tdo = 0;
    shift(ShiftSource::level(tdi), ShiftSink::buffer(&tdo), 1, tms);
    flush();
    return (tdo & 1u) != 0;
}

bool JtagTransport::drivePin(uint32_t pin, bool)
{
    return pin == JEXJTAG_TDI || pin == JEXJTAG_TMS || pin == JEXJTAG_TCK;
}

bool JtagTransport::readPin(uint32_t, bool&)
{
    return false;
}

void JtagTransport::setResetLines(bool, bool)
{
    throw std::runtime_error("this cable has no TRST or SRST line");
}

void JtagTransport::sleep(uint32_t microseconds)
{
    flush();
    PluginPlatform::sleepMicroseconds(microseconds);
}

} // namespace jexcable
