// SPDX-License-Identifier: MIT
#pragma once
// SvfBits - a bit vector in the plug-in's order (bit i is bit i%8 of byte
// i/8, shifted first).  Bits past `bits` in the last byte are always 0.
// The helpers build composite scans, compare TDO and print vectors as SVF
// hex text (most significant digit first).

#include <cstdint>
#include <string>
#include <vector>

namespace JexRT {

class SvfBits {
public:
    uint32_t size() const { return m_bits; }
    const uint8_t* data() const { return m_bytes.data(); }
    uint8_t* data() { return m_bytes.data(); }
    // n bits, all 0 (or all 1); the storage is reused.
    void assignZeros(uint32_t n);
    void assignOnes(uint32_t n);
    // Sets the bits from hex digits (values 0..15, most significant first,
    // no leading zeros); false when the value needs more than n bits.
    bool assignHex(const std::vector<uint8_t>& digits, uint32_t n);
    // ORs n bits of src (bit 0 on) into this vector from bit `at`.
    void orBits(uint64_t at, const uint8_t* src, uint32_t n);
    // n bits of src starting at bit `from`.
    void assignSlice(const uint8_t* src, uint64_t from, uint32_t n);
    void swap(SvfBits& other) noexcept { m_bytes.swap(other.m_bytes); std::swap(m_bits, other.m_bits); }

    // The first bit where (a XOR e) AND m is 1, or -1 when there is none;
    // all three hold `bits` bits.
    static int64_t firstMismatch(const uint8_t* a, const uint8_t* e, const uint8_t* m, uint32_t bits);
    // The bits as SVF hex text.  When the text needs more than maxChars
    // characters, the window of digits around bit `focus`, marked "..." on
    // each side that was cut (no marks when maxChars is below 8).
    std::string hex(size_t maxChars = SIZE_MAX, uint64_t focus = 0) const;

private:
    std::vector<uint8_t> m_bytes;
    uint32_t m_bits = 0;
};

} // namespace JexRT
