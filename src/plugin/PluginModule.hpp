// SPDX-License-Identifier: MIT
#pragma once
// PluginModule - the record of one plug-in module: its loaded library, its
// names and paths, the target types it serves and its five entry points.

#include <string>
#include <vector>

#include "jexjtag/plugin.h"
#include "platform/DynamicLibrary.hpp"

namespace JexRT {

struct PluginModule {
    // The loaded module; empty while nothing is loaded.  Freed by
    // PluginManager::unloadModule, which calls JexPlugin_unloaded first.
    jexplatform::DynamicLibrary handle;
    // The plug-in directory's name, also the stem of its files.
    std::string name;
    // The module file given to the loader.
    std::string libraryPath;
    // The descriptor file: the plug-in's key.
    std::string xmlPath;
    // The target types the plug-in serves, in descriptor order.
    std::vector<std::string> targetNames;

    JexPlugin_create_fn create = nullptr;
    JexPlugin_destroy_fn destroy = nullptr;
    JexPlugin_loaded_fn loaded = nullptr;
    JexPlugin_unloaded_fn unloaded = nullptr;
    JexPlugin_setCallbacks_fn setCallbacks = nullptr;

    PluginModule() = default;
    PluginModule(PluginModule&&) noexcept = default;
    PluginModule& operator=(PluginModule&&) noexcept = default;
    PluginModule(const PluginModule&) = delete;
    PluginModule& operator=(const PluginModule&) = delete;

    // Back to the empty record.  A library still loaded is freed without
    // JexPlugin_unloaded: unload it through the manager first.
    void reset();
    bool hasAllEntryPoints() const { return create && destroy && loaded && unloaded && setCallbacks; }
};

} // namespace JexRT
