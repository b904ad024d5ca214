// SPDX-License-Identifier: MIT
#pragma once
// Where the TDO bits of a shift go: nowhere, or a buffer (bit order of
// BitBuffer) with an optional mask.  A bit outside the mask (mask bit 0) is
// stored as 0.  A null mask means all bits.  Bits of the buffer beyond the
// shifted ones keep their values.  A sink is a small value: copy it freely
// (the buffer is the caller's and must outlive every copy written through).

#include <cstdint>

#include "BitBuffer.hpp"

namespace jexcable {

class ShiftSink {
public:
    static ShiftSink discard() { return ShiftSink(nullptr, nullptr); }
    static ShiftSink buffer(uint8_t* bits, const uint8_t* mask = nullptr) { return ShiftSink(bits, mask); }

    // False for discard(): nobody needs the TDO bits.
    bool wanted() const { return m_bits != nullptr; }
    // The buffer and the mask (null when none).
    uint8_t* bits() const { return m_bits; }
    const uint8_t* mask() const { return m_mask; }
    void put(uint64_t offset, unsigned n, uint64_t word) const
    {
        if (!m_bits) return;
        if (m_mask) word &= BitBuffer::load(m_mask, offset, n);
        BitBuffer::store(m_bits, offset, n, word);
    }
    void putBit(uint64_t offset, bool value) const
    {
        if (!m_bits) return;
        BitBuffer::set(m_bits, offset, value && (!m_mask || BitBuffer::get(m_mask, offset)));
    }

private:
    ShiftSink(uint8_t* bits, const uint8_t* mask) : m_bits(bits), m_mask(mask) {}

    uint8_t* m_bits;
    const uint8_t* m_mask;
};

} // namespace jexcable
