// SPDX-License-Identifier: MIT
#include "jexjtag/cable/ChainLayout.hpp"

namespace jexcable {

bool ChainLayout::resize(uint32_t count)
{
    if (count > kMaxDevices) return false;
    m_devices.resize(count);
    return true;
}

bool ChainLayout::setIrLength(uint32_t index, uint32_t length)
{
    if (!contains(index) || length > kMaxIrLength) return false;
    m_devices[index].irLength = length;
    return true;
}

bool ChainLayout::setIdcode(uint32_t index, uint32_t idcode)
{
    if (!contains(index)) return false;
    m_devices[index].idcode = idcode;
    return true;
}

uint64_t ChainLayout::irBitsBefore(uint32_t index) const
{
    uint64_t bits = 0;
    for (uint32_t i = 0; i < index && i < count(); ++i) bits += m_devices[i].irLength;
    return bits;
}

uint64_t ChainLayout::irBitsAfter(uint32_t index) const
{
    uint64_t bits = 0;
    if (!contains(index)) return 0;
    for (uint32_t i = index + 1; i < count(); ++i) bits += m_devices[i].irLength;
    return bits;
}

} // namespace jexcable
