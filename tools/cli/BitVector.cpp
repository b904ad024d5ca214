// SPDX-License-Identifier: MIT
#include "BitVector.hpp"

namespace jexjtag::cli {

BitVector::BitVector(unsigned bitCount) : m_bitCount(bitCount), m_bytes((static_cast<size_t>(bitCount) + 7) / 8, 0)
{
}

BitVector BitVector::fromBytes(const uint8_t* bytes, unsigned bitCount)
{
    BitVector bits(bitCount);
    for (size_t i = 0; i < bits.m_bytes.size(); ++i) bits.m_bytes[i] = bytes[i];
    if (bitCount % 8 != 0) bits.m_bytes.back() &= static_cast<uint8_t>((1u << (bitCount % 8)) - 1u);
    return bits;
}

bool BitVector::get(unsigned index) const
{
    return index < m_bitCount && ((m_bytes[index / 8] >> (index % 8)) & 1u) != 0;
}

void BitVector::set(unsigned index, bool value)
{
    if (index >= m_bitCount) return;
    const uint8_t mask = static_cast<uint8_t>(1u << (index % 8));
    if (value) m_bytes[index / 8] |= mask;
    else m_bytes[index / 8] &= static_cast<uint8_t>(~mask);
}

std::string BitVector::toBinary() const
{
    std::string text;
    text.reserve(m_bitCount);
    for (unsigned i = m_bitCount; i > 0; --i) text += get(i - 1) ? '1' : '0';
    return text;
}

std::string BitVector::toHex() const
{
    static const char kDigits[] = "0123456789ABCDEF";
    const unsigned digits = (m_bitCount + 3) / 4;
    std::string text = "0x";
    text.reserve(2 + digits);
    for (unsigned d = digits; d > 0; --d) {
        unsigned value = 0;
        for (unsigned b = 0; b < 4; ++b)
            if (get((d - 1) * 4 + b)) value |= 1u << b;
        text += kDigits[value];
    }
    return text;
}

} // namespace jexjtag::cli
