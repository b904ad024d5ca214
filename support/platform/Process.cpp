// SPDX-License-Identifier: MIT
#include "platform/Process.hpp"

#include <dlfcn.h>

#include <chrono>
#include <cstdlib>
#include <thread>

namespace jexplatform {

void sleepMilliseconds(unsigned ms)
{
    if (ms) std::this_thread::sleep_for(std::chrono::milliseconds(ms));
}

void sleepMicroseconds(unsigned us)
{
    if (us) std::this_thread::sleep_for(std::chrono::microseconds(us));
}

std::string moduleDirectoryOf(const void* address)
{
    Dl_info info {};
    if (!dladdr(address, &info) || !info.dli_fname) return {};
    std::string path = info.dli_fname;
    if (char* resolved = realpath(info.dli_fname, nullptr)) {
        path = resolved;
        std::free(resolved);
    }
    const auto slash = path.rfind('/');
    if (slash == std::string::npos) return ".";
    return path.substr(0, slash);
}

std::string environment(const char* name)
{
    const char* value = std::getenv(name);
    return value ? value : "";
}

} // namespace jexplatform
