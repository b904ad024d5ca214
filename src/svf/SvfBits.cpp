// SPDX-License-Identifier: MIT
#include "svf/SvfBits.hpp"

#include <algorithm>
#include <cstring>

namespace JexRT {

void SvfBits::assignZeros(uint32_t n)
{
    m_bits = n;
    m_bytes.assign((static_cast<size_t>(n) + 7) / 8, 0);
}

void SvfBits::assignOnes(uint32_t n)
{
    m_bits = n;
    m_bytes.assign((static_cast<size_t>(n) + 7) / 8, 0xFF);
    if (n % 8) m_bytes.back() = static_cast<uint8_t>((1u << (n % 8)) - 1);
}

bool SvfBits::assignHex(const std::vector<uint8_t>& digits, uint32_t n)
{
    const size_t count = digits.size();
    if (count) {
        unsigned top = 0;
        for (unsigned v = digits[0]; v; v >>= 1) ++top;
        if ((count - 1) * 4 + top > n) return false;
    }
    assignZeros(n);
    const uint8_t* last = digits.data() + count; // one past the least significant digit
    uint8_t* out = m_bytes.data();
    size_t pairs = count / 2;
    for (size_t j = 0; j < pairs; ++j, last -= 2) out[j] = static_cast<uint8_t>(last[-1] | (last[-2] << 4));
    if (count % 2) out[pairs] = last[-1];
    return true;
}

void SvfBits::orBits(uint64_t at, const uint8_t* src, uint32_t n)
{
    if (n == 0) return;
    const size_t srcBytes = (static_cast<size_t>(n) + 7) / 8;
    uint8_t* dst = m_bytes.data() + at / 8;
    const unsigned s = static_cast<unsigned>(at % 8);
    const size_t room = m_bytes.size() - at / 8;
    if (s == 0) {
        for (size_t i = 0; i < srcBytes; ++i) dst[i] |= src[i];
        return;
    }
    for (size_t i = 0; i < srcBytes; ++i) {
        dst[i] |= static_cast<uint8_t>(src[i] << s);
        const uint8_t high = static_cast<uint8_t>(src[i] >> (8 - s));
        if (high && i + 1 < room) dst[i + 1] |= high;
    }
}

void SvfBits::assignSlice(const uint8_t* src, uint64_t from, uint32_t n)
{
    assignZeros(n);
    const uint8_t* in = src + from / 8;
    const unsigned s = static_cast<unsigned>(from % 8);
    const size_t bytes = m_bytes.size();
    if (s == 0) {
        if (bytes) std::memcpy(m_bytes.data(), in, bytes);
    } else {
        // The last source byte needed is the one holding bit from + n - 1.
        const size_t lastIn = (s + static_cast<size_t>(n) - 1) / 8;
        for (size_t j = 0; j < bytes; ++j) {
            unsigned v = in[j] >> s;
            if (j + 1 <= lastIn) v |= static_cast<unsigned>(in[j + 1]) << (8 - s);
            m_bytes[j] = static_cast<uint8_t>(v);
        }
    }
    if (n % 8 && bytes) m_bytes.back() &= static_cast<uint8_t>((1u << (n % 8)) - 1);
}

int64_t SvfBits::firstMismatch(const uint8_t* a, const uint8_t* e, const uint8_t* m, uint32_t bits)
{
    const size_t bytes = (static_cast<size_t>(bits) + 7) / 8;
    for (size_t i = 0; i < bytes; ++i) {
        uint8_t diff = static_cast<uint8_t>((a[i] ^ e[i]) & m[i]);
        if (i + 1 == bytes && bits % 8) diff &= static_cast<uint8_t>((1u << (bits % 8)) - 1);
        if (diff) return static_cast<int64_t>(i * 8 + static_cast<unsigned>(__builtin_ctz(diff)));
    }
    return -1;
}

std::string SvfBits::hex(size_t maxChars, uint64_t focus) const
{
    static const char kDigits[] = "0123456789ABCDEF";
    const size_t digits = std::max<size_t>(1, (static_cast<size_t>(m_bits) + 3) / 4);
    size_t lo = 0;
    size_t hi = digits; // digit positions [lo, hi), position 0 is the rightmost
    const bool marked = maxChars >= 8;
    if (digits > maxChars) {
        const size_t keep = std::max<size_t>(1, marked ? maxChars - 6 : maxChars);
        const size_t centre = std::min<size_t>(focus / 4, digits - 1);
        lo = centre > keep / 2 ? centre - keep / 2 : 0;
        hi = std::min(digits, lo + keep);
        lo = hi - keep;
    }
    std::string text;
    text.reserve(hi - lo + 6);
    if (hi < digits && marked) text += "...";
    for (size_t pos = hi; pos-- > lo;) {
        const size_t byte = pos / 2;
        const unsigned v = byte < m_bytes.size() ? (m_bytes[byte] >> ((pos % 2) * 4)) & 0xF : 0;
        text += kDigits[v];
    }
    if (lo > 0 && marked) text += "...";
    return text;
}

} // namespace JexRT
