// SPDX-License-Identifier: MIT
#include "NumberText.hpp"

#include <cstdint>

namespace jexjtag::cli {

std::optional<unsigned> parseUnsigned(const std::string& text, unsigned maximum)
{
    if (text.empty() || text.size() > 10) return std::nullopt;
    uint64_t value = 0;
    for (const char c : text) {
        if (c < '0' || c > '9') return std::nullopt;
        value = value * 10 + static_cast<uint64_t>(c - '0');
    }
    if (value > maximum) return std::nullopt;
    return static_cast<unsigned>(value);
}

} // namespace jexjtag::cli
