// SPDX-License-Identifier: MIT
#pragma once
// The IDCODE texts the exported functions accept: 1 to 32 characters '0',
// '1', 'X' or 'x', most significant bit first (a shorter text counts as
// having leading zeros).

#include <cstring>

namespace JexRT {

inline bool isIdcodeText(const char* text)
{
    if (!text) return false;
    const size_t length = std::strlen(text);
    return length >= 1 && length <= 32 && std::strspn(text, "01Xx") == length;
}

} // namespace JexRT
