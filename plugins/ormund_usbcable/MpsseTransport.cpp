// SPDX-License-Identifier: MIT
#include "MpsseTransport.hpp"

#include <stdexcept>

#include "jexjtag/types.h"

namespace jexusb {

using jexcable::ShiftSink;
using jexcable::ShiftSource;

MpsseTransport::MpsseTransport(MpsseQueue& queue, FtdiLink& link, const AdapterProfile& profile)
    : m_queue(&queue), m_link(&link), m_profile(&profile)
{
}

void MpsseTransport::initialPins(const AdapterProfile& profile, uint16_t& value, uint16_t& direction)
{
    value = profile.value;
    direction = profile.direction;
    profile.trst.apply(false, value, direction);
    profile.srst.apply(false, value, direction);
}

void MpsseTransport::moveTms(const uint8_t* tms, uint32_t count, bool tdi)
{
    for (uint32_t i = 0; i < count; ++i) m_queue->clockTms(((tms[i / 8] >> (i % 8)) & 1u) != 0, tdi);
}

void MpsseTransport::shift(const ShiftSource& in, const ShiftSink& out, uint32_t count, bool tmsOnLast)
{
    m_queue->shift(in, out, count, tmsOnLast);
}

void MpsseTransport::idleClocks(uint64_t count, bool tms, bool tdi)
{
    m_queue->holdClocks(count, tms, tdi);
}

void MpsseTransport::flush()
{
    if (m_queue->flush()) return;
    const std::string error = m_queue->error();
    m_queue->clearError();
    std::string ignored;
    m_link->purge(ignored);
    throw std::runtime_error(error);
}

void MpsseTransport::applyPins(uint16_t value, uint16_t direction)
{
    const auto low = static_cast<uint8_t>(value & 0xFF);
    const auto lowDir = static_cast<uint8_t>(direction & 0xFF);
    const auto high = static_cast<uint8_t>(value >> 8);
    const auto highDir = static_cast<uint8_t>(direction >> 8);
    // Bits 0-3 of the low byte belong to the JTAG pins; the queue keeps them.
    if ((low & 0xF0) != (m_queue->lowValue() & 0xF0) || (lowDir & 0xF0) != (m_queue->lowDirection() & 0xF0))
        m_queue->setLow(static_cast<uint8_t>((low & 0xF0) | (m_queue->lowValue() & 0x0F)), lowDir);
    if (high != m_queue->highValue() || highDir != m_queue->highDirection()) m_queue->setHigh(high, highDir);
}

void MpsseTransport::setResetLines(bool trst, bool srst)
{
    auto value = static_cast<uint16_t>(m_queue->highValue() << 8 | m_queue->lowValue());
    auto direction = static_cast<uint16_t>(m_queue->highDirection() << 8 | m_queue->lowDirection());
    m_profile->trst.apply(trst, value, direction);
    m_profile->srst.apply(srst, value, direction);
    applyPins(value, direction);
    flush();
}

bool MpsseTransport::ownPin(uint32_t pin, uint16_t& mask) const
{
    if (pin >= kFirstLowPin + 4 && pin < kFirstLowPin + 8) mask = static_cast<uint16_t>(1u << (pin - kFirstLowPin));
    else if (pin >= kFirstHighPin && pin < kFirstHighPin + 8)
        mask = static_cast<uint16_t>(0x100u << (pin - kFirstHighPin));
    else return false;
    const uint16_t reserved = static_cast<uint16_t>(m_profile->trst.data | m_profile->trst.enable |
                                                    m_profile->srst.data | m_profile->srst.enable);
    return (mask & reserved) == 0;
}

bool MpsseTransport::drivePin(uint32_t pin, bool level)
{
    if (pin == JEXJTAG_TDI || pin == JEXJTAG_TMS || pin == JEXJTAG_TCK) return true;
    uint16_t mask = 0;
    if (!ownPin(pin, mask)) return false;
    auto value = static_cast<uint16_t>(m_queue->highValue() << 8 | m_queue->lowValue());
    auto direction = static_cast<uint16_t>(m_queue->highDirection() << 8 | m_queue->lowDirection());
    value = level ? static_cast<uint16_t>(value | mask) : static_cast<uint16_t>(value & ~mask);
    applyPins(value, static_cast<uint16_t>(direction | mask));
    flush();
    return true;
}

bool MpsseTransport::readPin(uint32_t pin, bool& level)
{
    uint16_t mask = 0;
    if (pin == JEXJTAG_TDO) mask = 0x0004;
    else if (!ownPin(pin, mask)) return false;
    uint8_t byte = 0;
    if (mask & 0xFF) m_queue->readLow(&byte);
    else m_queue->readHigh(&byte);
    flush();
    level = ((mask & 0xFF ? mask : mask >> 8) & byte) != 0;
    return true;
}

} // namespace jexusb
