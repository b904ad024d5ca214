// SPDX-License-Identifier: MIT
#include "jexjtag/cable/TextCopy.hpp"

#include <algorithm>
#include <cstring>

namespace jexcable {

void TextCopy::toField(char* field, std::size_t size, const std::string& text)
{
    if (!field || size == 0) return;
    const std::size_t n = std::min(text.size(), size - 1);
    std::memcpy(field, text.data(), n);
    field[n] = '\0';
}

bool TextCopy::toReply(uint8_t* out, uint32_t* length, const std::string& text)
{
    if (!length) return false;
    const uint32_t capacity = *length;
    if (capacity > 0) {
        if (!out) return false;
        const std::size_t n = std::min<std::size_t>(text.size(), capacity - 1);
        std::memcpy(out, text.data(), n);
        out[n] = 0;
    }
    *length = static_cast<uint32_t>(std::min<std::size_t>(text.size(), UINT32_MAX));
    return true;
}

std::string TextCopy::fromInput(const uint8_t* in, uint32_t length)
{
    if (!in) return {};
    const auto* begin = reinterpret_cast<const char*>(in);
    const auto* end = static_cast<const char*>(std::memchr(begin, 0, length));
    return std::string(begin, end ? end : begin + length);
}

} // namespace jexcable
