// SPDX-License-Identifier: MIT
#pragma once
// Bit access to the buffers of the plug-in ABI: bit i of a buffer is bit
// (i % 8) of byte (i / 8), and bit 0 is shifted first.  Word functions move up
// to 64 bits at once, touching only the bytes that hold those bits.

#include <cstddef>
#include <cstdint>

namespace jexcable {

class BitBuffer {
public:
    static constexpr uint64_t lowMask(unsigned n) { return n >= 64 ? ~uint64_t{0} : (uint64_t{1} << n) - 1; }

    static bool get(const uint8_t* bytes, uint64_t bit) { return (bytes[bit >> 3] >> (bit & 7)) & 1u; }
    static void set(uint8_t* bytes, uint64_t bit, bool value)
    {
        const auto m = static_cast<uint8_t>(1u << (bit & 7));
        if (value) bytes[bit >> 3] |= m;
        else bytes[bit >> 3] &= static_cast<uint8_t>(~m);
    }

    // The n bits (1..64) starting at bit `offset`, bit `offset` in bit 0.
    static uint64_t load(const uint8_t* bytes, uint64_t offset, unsigned n)
    {
        const uint8_t* p = bytes + (offset >> 3);
        const unsigned skip = static_cast<unsigned>(offset & 7);
        const unsigned span = (skip + n + 7) / 8; // bytes that hold the bits, 1..9
        uint64_t word = 0;
        const unsigned first = span > 8 ? 8 : span;
        for (unsigned i = 0; i < first; ++i) word |= static_cast<uint64_t>(p[i]) << (8 * i);
        word >>= skip;
        if (span > 8) word |= static_cast<uint64_t>(p[8]) << (64 - skip);
        return word & lowMask(n);
    }

    // Writes the n low bits (1..64) of word at bit `offset`; other bits of the
    // touched bytes keep their values.
    static void store(uint8_t* bytes, uint64_t offset, unsigned n, uint64_t word)
    {
        uint8_t* p = bytes + (offset >> 3);
        unsigned skip = static_cast<unsigned>(offset & 7);
        word &= lowMask(n);
        unsigned left = n;
        while (left > 0) {
            const unsigned take = (8 - skip) < left ? (8 - skip) : left;
            const auto m = static_cast<uint8_t>(((1u << take) - 1u) << skip);
            *p = static_cast<uint8_t>((*p & ~m) | ((static_cast<unsigned>(word) << skip) & m));
            word >>= take;
            left -= take;
            skip = 0;
            ++p;
        }
    }

    static std::size_t bytesFor(uint64_t bits) { return static_cast<std::size_t>((bits + 7) / 8); }
};

} // namespace jexcable
