// SPDX-License-Identifier: MIT
#pragma once
// A loaded dynamic library: move-only owner of the loader handle.

#include <string>

namespace jexplatform {

class DynamicLibrary {
public:
    DynamicLibrary() = default;
    ~DynamicLibrary();
    DynamicLibrary(DynamicLibrary&& other) noexcept;
    DynamicLibrary& operator=(DynamicLibrary&& other) noexcept;
    DynamicLibrary(const DynamicLibrary&) = delete;
    DynamicLibrary& operator=(const DynamicLibrary&) = delete;

    // Loads the file at path (local symbol scope).  Check isLoaded().
    static DynamicLibrary load(const std::string& path);

    bool isLoaded() const { return m_handle != nullptr; }
    // Raw address of an exported symbol, null when absent.
    void* rawSymbol(const char* name) const;
    // Typed address of an exported function, null when absent.
    template <typename Fn>
    Fn symbol(const char* name) const
    {
        return reinterpret_cast<Fn>(rawSymbol(name));
    }
    // Frees the library; true when the loader reports success.  Not loaded: false.
    bool unload();
    // The loader's text for the last failure ("" when none).
    const std::string& error() const { return m_error; }

private:
    void* m_handle = nullptr;
    std::string m_error;
};

} // namespace jexplatform
