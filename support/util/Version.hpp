#pragma once
// Version texts of the library.

// Decimal digits and dots, for example "1.0.0".
const char* getVersionNumber();
// The version with the build number, for example "1.0.0 (build 12)".
const char* getVersionWithBuildNumber();
