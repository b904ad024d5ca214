// SPDX-License-Identifier: MIT
#pragma once
// How the recording test plug-in writes the values it receives, shared with
// the tests that read its record.

#include <cstdint>
#include <cstdio>
#include <string>

namespace recording {

// Environment: the file every call is appended to, and the default
// configuration ("key=value;key=value", see RecordingPlugin.cpp).
constexpr const char* kRecordFileVariable = "JEXJTAG_RECORDING_FILE";
constexpr const char* kConfigVariable = "JEXJTAG_RECORDING_CONFIG";

// A pointer as "0x<lower-case hex>" or "null".
inline std::string pointerText(const void* pointer)
{
    if (!pointer) return "null";
    char text[32];
    std::snprintf(text, sizeof text, "0x%llx",
                  static_cast<unsigned long long>(reinterpret_cast<std::uintptr_t>(pointer)));
    return text;
}

} // namespace recording
