// SPDX-License-Identifier: MIT
// PluginManager: construction, module loading and unloading, instances.

#include "plugin/PluginManager.hpp"

#include "platform/FileSystem.hpp"
#include "platform/Process.hpp"
#include "plugin/PluginHostCallbacks.hpp"
#include "util/Jex_Util.hpp"
#include "util/Logger.hpp"
#include "util/MethodLogger.hpp"

namespace JexRT {

PluginManager::PluginManager() { init(); }

PluginManager::~PluginManager() { removeAllPlugins(); }

unsigned PluginManager::init()
{
    MethodLogger tracer;
    tracer.setMethodName("PluginManager::init");
    const std::string configured = jexplatform::environment("JEXJTAG_PLUGIN_DIR");
    if (!configured.empty())
        m_pluginRoot = configured;
    else
        m_pluginRoot = Jex_Util::getPluginRootPath();
    return tracer.setReturnStatus(addAllPlugins());
}

unsigned PluginManager::loadModule(std::string name, std::string libraryPath, PluginModule& module)
{
    MethodLogger tracer;
    tracer.setMethodName("PluginManager::loadModule");
    module.reset();
    unsigned status = JEX_FAILURE;
    if (name.empty()) {
        Logger::logger.printLog(1, "PluginManager::loadModule() - Invalid library\n");
        return tracer.setReturnStatus(status);
    }
    module.name = std::move(name);
    module.libraryPath = std::move(libraryPath);

    module.handle = jexplatform::DynamicLibrary::load(module.libraryPath);
    if (module.handle.isLoaded()) {
        module.create = module.handle.symbol<JexPlugin_create_fn>("JexPlugin_create");
        module.destroy = module.handle.symbol<JexPlugin_destroy_fn>("JexPlugin_destroy");
        module.loaded = module.handle.symbol<JexPlugin_loaded_fn>("JexPlugin_loaded");
        module.unloaded = module.handle.symbol<JexPlugin_unloaded_fn>("JexPlugin_unloaded");
        module.setCallbacks = module.handle.symbol<JexPlugin_setCallbacks_fn>("JexPlugin_setCallbacks");
    } else {
        if (Logger::logger.isEnabled(5))
            Logger::logger.printLog(5, "PluginManager::loadModule(%s) - %s\n", module.name.c_str(),
                                    module.handle.error().c_str());
        Logger::logger.printLog(2, "PluginManager::loadModule(%s) - Failed loading module\n", module.name.c_str());
    }

    if (module.hasAllEntryPoints()) {
        module.loaded();
        // The table lives for this call only; the module copies what it keeps.
        const JexPluginCallbacks callbacks = makePluginHostCallbacks();
        module.setCallbacks(&callbacks);
        status = JEX_SUCCESS;
    } else if (module.handle.isLoaded()) {
        Logger::logger.printLog(1,
                                "PluginManager::loadModule(%s) - Not all required functions were implemented "
                                "in plugin\n",
                                module.name.c_str());
    }

    if (JEX_FAILED(status)) unloadModule(module);
    return tracer.setReturnStatus(status);
}

unsigned PluginManager::unloadModule(PluginModule& module)
{
    MethodLogger tracer;
    tracer.setMethodName("PluginManager::unloadModule");
    if (!module.handle.isLoaded()) {
        Logger::logger.printLog(3, "PluginManager::unloadModule() - Nothing to unload\n");
        return tracer.setReturnStatus(JEX_FAILURE);
    }
    if (module.unloaded) module.unloaded();
    // The entry points point into the library that is about to go away.
    module.create = nullptr;
    module.destroy = nullptr;
    module.loaded = nullptr;
    module.unloaded = nullptr;
    module.setCallbacks = nullptr;
    if (!module.handle.unload()) return tracer.setReturnStatus(JEX_FAILURE);
    Logger::logger.printLog(3, "PluginManager::unloadModule() - Successfully unloaded plugin: %s\n",
                            module.libraryPath.c_str());
    return tracer.setReturnStatus(JEX_SUCCESS);
}

void PluginManager::removeAllPlugins()
{
    MethodLogger tracer;
    tracer.setMethodName("PluginManager::removeAllPlugins");
    std::lock_guard<std::recursive_mutex> lock(m_mutex);
    // The views in the tables point into the records: clear them first.
    m_targetTypes.clear();
    m_typeToKey.clear();
    m_keyToPlugin.clear();
    // Last loaded first, as shared objects are finalised.
    while (!m_modules.empty()) {
        unloadModule(*m_modules.back());
        m_modules.pop_back();
    }
}

PluginModule* PluginManager::moduleFor(const std::string& type, const char* who) const
{
    const auto key = m_typeToKey.find(type.c_str());
    if (key == m_typeToKey.end()) {
        Logger::logger.printLog(1, "PluginManager::%s(%s) - No key for this type\n", who, type.c_str());
        return nullptr;
    }
    const auto plugin = m_keyToPlugin.find(key->second);
    if (plugin == m_keyToPlugin.end()) {
        Logger::logger.printLog(1, "PluginManager::%s(%s) - No plugin for this key, %s\n", who, type.c_str(),
                                key->second.data());
        return nullptr;
    }
    return plugin->second;
}

JexPluginInstance* PluginManager::createPluginInstance(std::string type, const PluginModule** creator)
{
    MethodLogger tracer;
    tracer.setMethodName("PluginManager::createPluginInstance");
    std::lock_guard<std::recursive_mutex> lock(m_mutex);
    if (creator) *creator = nullptr;
    PluginModule* module = moduleFor(type, "createPluginInstance");
    if (!module || !module->create) return nullptr;
    if (creator) *creator = module;
    return module->create();
}

void PluginManager::destroyPluginInstance(std::string type, JexPluginInstance* instance)
{
    MethodLogger tracer;
    tracer.setMethodName("PluginManager::destroyPluginInstance");
    std::lock_guard<std::recursive_mutex> lock(m_mutex);
    PluginModule* module = moduleFor(type, "destroyPluginInstance");
    if (!module || !module->destroy) return;
    module->destroy(instance);
}

void PluginManager::destroyPluginInstance(const PluginModule* creator, JexPluginInstance* instance)
{
    MethodLogger tracer;
    tracer.setMethodName("PluginManager::destroyPluginInstance");
    std::lock_guard<std::recursive_mutex> lock(m_mutex);
    if (creator && creator->destroy) creator->destroy(instance);
}

} // namespace JexRT
