// SPDX-License-Identifier: MIT
#pragma once
// Small texts for trace lines, built without heap allocation.  Build them
// only when the log level that prints them is enabled.

#include <cstdint>
#include <cstdio>

// "JEX_FAILURE" for any status with bit 31 set, else "JEX_SUCCESS".
inline const char* statusText(unsigned status)
{
    return (status & 0x80000000u) ? "JEX_FAILURE" : "JEX_SUCCESS";
}

// A pointer as "0xXXXXXXXX" (upper-case hex, at least 8 digits) or "NULL".
class PointerText {
public:
    explicit PointerText(const void* pointer)
    {
        if (!pointer) {
            std::snprintf(m_text, sizeof m_text, "NULL");
        } else {
            std::snprintf(m_text, sizeof m_text, "0x%08llX",
                          static_cast<unsigned long long>(reinterpret_cast<std::uintptr_t>(pointer)));
        }
    }
    const char* c_str() const { return m_text; }

private:
    char m_text[24];
};
