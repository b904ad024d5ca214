// SPDX-License-Identifier: MIT
#pragma once
// Small text helpers shared by the BSDL reader's classes.  VHDL (and so
// BSDL) identifiers and keywords are case-insensitive, and only ASCII
// letters count as letters.

#include <cstddef>
#include <string>
#include <string_view>

namespace jexbsdl {

inline char toUpperAscii(char c) { return (c >= 'a' && c <= 'z') ? static_cast<char>(c - 'a' + 'A') : c; }

inline bool isLetter(char c) { return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z'); }

inline bool isDigit(char c) { return c >= '0' && c <= '9'; }

inline bool isIdentifierChar(char c) { return isLetter(c) || isDigit(c) || c == '_'; }

// Equal ignoring ASCII case.
inline bool equalsIgnoreCase(std::string_view a, std::string_view b)
{
    if (a.size() != b.size()) return false;
    for (size_t i = 0; i < a.size(); ++i)
        if (toUpperAscii(a[i]) != toUpperAscii(b[i])) return false;
    return true;
}

inline std::string upperCase(std::string_view text)
{
    std::string out(text);
    for (char& c : out) c = toUpperAscii(c);
    return out;
}

// A piece of the file's text fit for a message: at most `limit` characters,
// control and non-ASCII bytes shown as '?', in single quotes.
inline std::string quoted(std::string_view text, size_t limit = 40)
{
    std::string out = "'";
    for (size_t i = 0; i < text.size() && i < limit; ++i) {
        const unsigned char c = static_cast<unsigned char>(text[i]);
        out += (c >= 0x20 && c < 0x7f) ? static_cast<char>(c) : '?';
    }
    if (text.size() > limit) out += "...";
    out += "'";
    return out;
}

} // namespace jexbsdl
