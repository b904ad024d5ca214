// SPDX-License-Identifier: MIT
#pragma once
// Where the TDI bits of a shift come from: a constant level, or a buffer
// (bit order of BitBuffer) with an optional mask.  A bit outside the mask
// (mask bit 0) is driven low: TDI = data AND mask.  A null mask means all bits.

#include <cstdint>

#include "BitBuffer.hpp"

namespace jexcable {

class ShiftSource {
public:
    static ShiftSource level(bool high) { return ShiftSource(nullptr, nullptr, high); }
    static ShiftSource buffer(const uint8_t* bits, const uint8_t* mask = nullptr)
    {
        return ShiftSource(bits, mask, false);
    }

    // The n bits (1..64) that start at offset.
    uint64_t word(uint64_t offset, unsigned n) const
    {
        if (!m_bits) return m_level ? BitBuffer::lowMask(n) : 0;
        uint64_t w = BitBuffer::load(m_bits, offset, n);
        if (m_mask) w &= BitBuffer::load(m_mask, offset, n);
        return w;
    }
    bool bit(uint64_t offset) const
    {
        if (!m_bits) return m_level;
        return BitBuffer::get(m_bits, offset) && (!m_mask || BitBuffer::get(m_mask, offset));
    }
    // True for level(): every bit is level().
    bool isConstant() const { return m_bits == nullptr; }
    bool level() const { return m_level; }
    // The buffer and the mask (null for a constant level, or no mask).
    const uint8_t* bits() const { return m_bits; }
    const uint8_t* mask() const { return m_mask; }

private:
    ShiftSource(const uint8_t* bits, const uint8_t* mask, bool high) : m_bits(bits), m_mask(mask), m_level(high) {}

    const uint8_t* m_bits;
    const uint8_t* m_mask;
    bool m_level;
};

} // namespace jexcable
