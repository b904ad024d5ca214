// SPDX-License-Identifier: MIT
#pragma once
// Version texts of the library.

// Decimal digits and dots, for example "1.0.0".
const char* getVersionNumber();
// The version with the build number, for example "1.0.0 (build 12)".
const char* getVersionWithBuildNumber();
// The API version number of a version text: each character other than '.'
// becomes a nibble (its code minus '0'), most significant first; a result
// below 0x1000 is shifted left by 8.  "9.2" -> 0x9200, "9.2.1" -> 0x92100,
// "10.1.2" -> 0x1012, "" -> 0.
unsigned versionNumberFromText(const char* text);
