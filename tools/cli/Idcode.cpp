// SPDX-License-Identifier: MIT
#include "Idcode.hpp"

#include <cstdio>

#include "DataText.hpp"
#include "UsageError.hpp"

namespace jexjtag::cli {

uint32_t parseIdcode(const std::string& text)
{
    DataValue value;
    try {
        value = parseData(text, 32u);
    } catch (const UsageError&) {
        throw UsageError("'" + text + "' is not an IDCODE: write it as hex (0x0362D093) or as up to 32 binary digits");
    }
    uint32_t idcode = 0;
    for (unsigned i = 0; i < 32; ++i)
        if (value.bits.get(i)) idcode |= 1u << i;
    return idcode;
}

std::string idcodeHex(uint32_t idcode)
{
    char text[16];
    std::snprintf(text, sizeof text, "0x%08X", static_cast<unsigned>(idcode));
    return text;
}

std::string idcodeBits(uint32_t idcode)
{
    std::string text(32, '0');
    for (unsigned i = 0; i < 32; ++i)
        if ((idcode >> i) & 1u) text[31 - i] = '1';
    return text;
}

std::optional<uint32_t> idcodeFromBits(const std::string& bits)
{
    if (bits.empty() || bits.size() > 32) return std::nullopt;
    uint32_t value = 0;
    for (const char c : bits) {
        if (c != '0' && c != '1') return std::nullopt;
        value = (value << 1) | static_cast<uint32_t>(c - '0');
    }
    return value;
}

} // namespace jexjtag::cli
