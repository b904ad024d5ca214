#include "util/Version.hpp"

#include "util/VersionInfo.hpp"

const char* getVersionNumber() { return JEXJTAG_VERSION_TEXT; }
const char* getVersionWithBuildNumber() { return JEXJTAG_BUILD_TEXT; }
