// SPDX-License-Identifier: MIT
#pragma once
// Process-level services of the platform.

#include <string>

namespace jexplatform {

// Blocks the calling thread for ms milliseconds (0 returns at once).
void sleepMilliseconds(unsigned ms);
// Blocks the calling thread for at least us microseconds (0 returns at once).
void sleepMicroseconds(unsigned us);
// Directory of the loaded module that contains `address` (a function or
// object of that module), without a trailing separator; "" when unknown.
std::string moduleDirectoryOf(const void* address);
// Value of an environment variable, "" when unset.
std::string environment(const char* name);

} // namespace jexplatform
