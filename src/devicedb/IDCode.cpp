// SPDX-License-Identifier: MIT
#include "jexjtag/rt/IDCode.hpp"

#include <algorithm>

namespace JexRT {

namespace {

constexpr unsigned kBits = 32;

std::string textOf(unsigned int code)
{
    std::string text(kBits, '0');
    for (unsigned i = 0; i < kBits; ++i)
        if (code & (1u << (kBits - 1 - i))) text[i] = '1';
    return text;
}

} // namespace

IDCode::IDCode() : m_idcode(kBits, '0') {}
IDCode::IDCode(unsigned int code) : m_idcode(textOf(code)) {}
IDCode::IDCode(const std::string& text) : m_idcode(text) {}
IDCode::IDCode(const IDCode& other) = default;
IDCode::~IDCode() { m_idcode.clear(); }

void IDCode::setIDCode(unsigned int code) { m_idcode = textOf(code); }
void IDCode::setIDCode(const std::string& text) { m_idcode = text; }
void IDCode::setIDCode(const IDCode& other) { m_idcode = other.m_idcode; }

IDCode& IDCode::operator=(unsigned int code)
{
    setIDCode(code);
    return *this;
}

IDCode& IDCode::operator=(const std::string& text)
{
    setIDCode(text);
    return *this;
}

IDCode& IDCode::operator=(const IDCode& other)
{
    if (this != &other) setIDCode(other);
    return *this;
}

std::string IDCode::getIDCode() const { return m_idcode; }

unsigned int IDCode::length() const { return static_cast<unsigned int>(m_idcode.size()); }

unsigned int IDCode::getIDCode32() const
{
    // Shifting past bit 31 drops the earlier characters, so a longer text
    // gives the value of its last 32.
    unsigned int value = 0;
    for (char c : m_idcode) value = (value << 1) | (c == '1' ? 1u : 0u);
    return value;
}

unsigned char IDCode::operator[](unsigned int index) const
{
    if (index >= m_idcode.size()) return 0;
    return m_idcode[index] == '1' ? 1 : 0;
}

bool IDCode::isEqual(const IDCode& other) const
{
    const std::string& a = m_idcode;
    const std::string& b = other.m_idcode;
    const size_t n = std::max(a.size(), b.size());
    const size_t padA = n - a.size();
    const size_t padB = n - b.size();
    for (size_t i = 0; i < n; ++i) {
        const char ca = i < padA ? '0' : a[i - padA];
        const char cb = i < padB ? '0' : b[i - padB];
        if (ca != cb && ca != 'X' && cb != 'X') return false;
    }
    return true;
}

bool IDCode::operator==(unsigned int code) const { return isEqual(IDCode(code)); }

bool IDCode::operator==(const std::string& text) const { return isEqual(IDCode(text)); }

} // namespace JexRT
