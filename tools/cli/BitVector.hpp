// SPDX-License-Identifier: MIT
#pragma once
// A run of bits in the order the cable plug-ins use: bit i is bit (i % 8) of
// byte (i / 8), and bit 0 is shifted first (it is the bit nearest TDO).

#include <cstdint>
#include <string>
#include <vector>

namespace jexjtag::cli {

class BitVector {
public:
    BitVector() = default;
    // bitCount zero bits.
    explicit BitVector(unsigned bitCount);
    // The first bitCount bits of bytes, (bitCount + 7) / 8 of them.
    static BitVector fromBytes(const uint8_t* bytes, unsigned bitCount);

    unsigned size() const { return m_bitCount; }
    bool get(unsigned index) const;
    void set(unsigned index, bool value);

    // The buffer handed to the library; bits past size() are always 0.
    const std::vector<uint8_t>& bytes() const { return m_bytes; }
    uint8_t* data() { return m_bytes.data(); }
    const uint8_t* data() const { return m_bytes.data(); }

    // The bits as a number written most significant bit first: the last
    // character is bit 0, the first one shifted.
    std::string toBinary() const;
    // The same number in hexadecimal, "0x" and (size() + 3) / 4 upper-case
    // digits; an empty vector gives "0x".
    std::string toHex() const;

    bool operator==(const BitVector& other) const
    {
        return m_bitCount == other.m_bitCount && m_bytes == other.m_bytes;
    }
    bool operator!=(const BitVector& other) const { return !(*this == other); }

private:
    unsigned m_bitCount = 0;
    std::vector<uint8_t> m_bytes;
};

} // namespace jexjtag::cli
