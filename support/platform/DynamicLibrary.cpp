// SPDX-License-Identifier: MIT
#include "platform/DynamicLibrary.hpp"

#include <dlfcn.h>

#include <utility>

namespace jexplatform {

DynamicLibrary::~DynamicLibrary() { unload(); }

DynamicLibrary::DynamicLibrary(DynamicLibrary&& other) noexcept
    : m_handle(std::exchange(other.m_handle, nullptr)), m_error(std::move(other.m_error))
{
}

DynamicLibrary& DynamicLibrary::operator=(DynamicLibrary&& other) noexcept
{
    if (this != &other) {
        unload();
        m_handle = std::exchange(other.m_handle, nullptr);
        m_error = std::move(other.m_error);
    }
    return *this;
}

DynamicLibrary DynamicLibrary::load(const std::string& path)
{
    DynamicLibrary lib;
    lib.m_handle = dlopen(path.c_str(), RTLD_NOW | RTLD_LOCAL);
    if (!lib.m_handle) {
        const char* text = dlerror();
        lib.m_error = text ? text : "unknown loader error";
    }
    return lib;
}

void* DynamicLibrary::rawSymbol(const char* name) const
{
    if (!m_handle || !name) return nullptr;
    return dlsym(m_handle, name);
}

bool DynamicLibrary::unload()
{
    if (!m_handle) return false;
    const int rc = dlclose(m_handle);
    m_handle = nullptr;
    if (rc != 0) {
        const char* text = dlerror();
        m_error = text ? text : "unknown loader error";
        return false;
    }
    return true;
}

} // namespace jexplatform
