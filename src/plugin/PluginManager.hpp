// SPDX-License-Identifier: MIT
#pragma once
// PluginManager - the one owner of the plug-in modules of the process.
//
// It walks the plug-in tree (<root>/<company>/<P>/P.xml and P.so), loads
// every plug-in whose descriptor is accepted, keeps the tables that map a
// target type to the module serving it, lists the targets for hosts, and
// creates and destroys plug-in instances for the target layer.  Safe to
// use from several threads.  Discovery
// only adds; modules are unloaded together when the manager is destroyed.
//
// The tables hold views into strings of the module records the manager
// owns; a record never changes while it is in the tables.

#include <memory>
#include <mutex>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "jexjtag/plugin.h"
#include "plugin/PluginModule.hpp"

namespace JexRT {

class PluginManager {
public:
    // Creates empty tables, then runs init() (its status is not kept).
    PluginManager();
    // Unloads every module (removeAllPlugins).
    ~PluginManager();
    PluginManager(const PluginManager&) = delete;
    PluginManager& operator=(const PluginManager&) = delete;

    // Sets the plug-in root - <directory of libJexJtag>/plugins, or
    // $JEXJTAG_PLUGIN_DIR when set - and runs the first discovery.
    unsigned init();

    // Loads libraryPath as module `name` into `module`: resolves the five
    // entry points, then calls JexPlugin_loaded and JexPlugin_setCallbacks.
    // On failure the module is unloaded again and the status is JEX_FAILURE.
    unsigned loadModule(std::string name, std::string libraryPath, PluginModule& module);
    // Calls JexPlugin_unloaded (when resolved) and frees the library.
    unsigned unloadModule(PluginModule& module);
    // Unloads and deletes every module (last loaded first) and empties the tables.
    void removeAllPlugins();

    // A new instance from the module serving `type` (JexPlugin_create's
    // result, null included); null when no module serves it.  *creator,
    // when given, is set to that module (null when none).
    JexPluginInstance* createPluginInstance(std::string type, const PluginModule** creator = nullptr);
    // Gives an instance back to the module serving `type` (JexPlugin_destroy).
    void destroyPluginInstance(std::string type, JexPluginInstance* instance);
    // Gives an instance back to the module that created it, whatever module
    // serves its type now (a later discovery may have added another).  A
    // module stays loaded as long as the manager lives.
    void destroyPluginInstance(const PluginModule* creator, JexPluginInstance* instance);

    // Discovery: loads the plug-ins of the tree that are not loaded yet.
    // JEX_SUCCESS when at least one module was newly loaded.
    unsigned addAllPlugins();
    unsigned refreshTargetList();

    // The target list, in discovery order.
    unsigned getTargetCount();
    // Descriptor size + 1 for the target at index; 0 on any failure.
    unsigned getXMLSizeByIndex(unsigned index);
    // Copies the target's descriptor into xmlBuf (zero-filled, at most
    // xmlBufLen - 1 bytes) and sets its type and plug-in names.
    unsigned getTargetByIndex(unsigned index, char* xmlBuf, unsigned xmlBufLen, std::string* targetName,
                              std::string* pluginName);

    const std::string& getPluginRoot() const { return m_pluginRoot; }
    // Number of modules loaded.
    size_t getModuleCount() const { return m_modules.size(); }

private:
    // The module serving the target at index, or null after logging
    // "<who>() - type is 0!" / "key is 0!" / "plugin is 0!".
    const PluginModule* moduleAt(unsigned index, const char* who) const;
    // The module serving `type`, or null after logging "<who>(<type>) - ...".
    PluginModule* moduleFor(const std::string& type, const char* who) const;

    // Sessions of different threads share the manager: every public
    // operation holds this (recursive: a plug-in may call back in).
    mutable std::recursive_mutex m_mutex;
    std::vector<const char*> m_targetTypes;
    std::unordered_map<std::string_view, std::string_view> m_typeToKey;
    std::unordered_map<std::string_view, PluginModule*> m_keyToPlugin;
    std::string m_pluginRoot;
    // The records, in load order; m_keyToPlugin points into them.
    std::vector<std::unique_ptr<PluginModule>> m_modules;
};

} // namespace JexRT
