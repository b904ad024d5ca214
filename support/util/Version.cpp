// SPDX-License-Identifier: MIT
#include "util/Version.hpp"

#include "util/VersionInfo.hpp"

const char* getVersionNumber() { return JEXJTAG_VERSION_TEXT; }
const char* getVersionWithBuildNumber() { return JEXJTAG_BUILD_TEXT; }

unsigned versionNumberFromText(const char* text)
{
    unsigned value = 0;
    for (const char* p = text; p && *p; ++p) {
        if (*p == '.') continue;
        value = (value << 4) | static_cast<unsigned>(*p - 48);
    }
    if (value < 0x1000u) value <<= 8;
    return value;
}
