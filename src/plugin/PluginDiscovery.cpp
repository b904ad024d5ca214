// SPDX-License-Identifier: MIT
// PluginManager: discovery of the plug-ins in the plug-in tree.
//
//   <root>/<company>/<P>/P.xml   the descriptor, the plug-in's key
//   <root>/<company>/<P>/P.so    the module
//
// Entries that are not directories are passed over; nothing deeper than a
// plug-in directory is looked at.

#include "platform/FileSystem.hpp"
#include "plugin/PluginManager.hpp"
#include "plugin/PluginXMLInfo.hpp"
#include "util/Jex_Util.hpp"
#include "util/Logger.hpp"
#include "util/MethodLogger.hpp"

namespace JexRT {

namespace {

constexpr const char* kModuleSuffix = ".so";
constexpr const char* kDescriptorSuffix = ".xml";

std::string join(const std::string& dir, const std::string& entry) { return dir + jexplatform::kPathSeparator + entry; }

// Logs the "Found" line and tells whether path is a directory.
bool foundDirectory(const std::string& path)
{
    const bool isDir = Jex_Util::isDirectory(path) != 0;
    Logger::logger.printLog(3, "PluginManager::addAllPlugins() - Found %s, isDir? %s\n", path.c_str(),
                            isDir ? "Yes" : "No");
    return isDir;
}

} // namespace

unsigned PluginManager::addAllPlugins()
{
    MethodLogger tracer;
    tracer.setMethodName("PluginManager::addAllPlugins");
    std::lock_guard<std::recursive_mutex> lock(m_mutex);
    unsigned status = JEX_FAILURE;
    const std::string root = m_pluginRoot;

    std::vector<std::string> companies;
    Jex_Util::getDirectoryFileList(root, false, companies);
    Logger::logger.printLog(3, "PluginManager::addAllPlugins() - Searching for Company Directories in: %s\n",
                            root.c_str());

    for (const std::string& company : companies) {
        const std::string companyDir = join(root, company);
        if (!foundDirectory(companyDir)) continue;

        std::vector<std::string> plugins;
        Jex_Util::getDirectoryFileList(companyDir, false, plugins);
        Logger::logger.printLog(3, "PluginManager::addAllPlugins() - Searching for Plug-in Directories in: %s\n",
                                companyDir.c_str());

        for (const std::string& plugin : plugins) {
            const std::string pluginDir = join(companyDir, plugin);
            if (!foundDirectory(pluginDir)) continue;

            const std::string xmlPath = join(pluginDir, plugin + kDescriptorSuffix);
            std::vector<std::string> targetNames;
            const unsigned xmlStatus = getPluginXMLInfo(xmlPath, targetNames);

            if (m_keyToPlugin.count(xmlPath)) {
                Logger::logger.printLog(3, "PluginManager::addAllPlugins() - %s is already loaded!\n",
                                        plugin.c_str());
                continue;
            }
            if (JEX_FAILED(xmlStatus)) continue;
            Logger::logger.printLog(3, "PluginManager::addAllPlugins() - Valid Plugin xml found: %s\n",
                                    xmlPath.c_str());

            const std::string libraryPath = join(pluginDir, plugin + kModuleSuffix);
            PluginModule loaded;
            if (JEX_FAILED(loadModule(plugin, libraryPath, loaded))) continue;
            Logger::logger.printLog(3, "PluginManager::addAllPlugins() - Loaded %s successfully.\n",
                                    libraryPath.c_str());

            // From here on the record's strings do not change: the tables
            // hold views into them.
            auto record = std::make_unique<PluginModule>(std::move(loaded));
            record->targetNames = std::move(targetNames);
            record->xmlPath = xmlPath;
            m_modules.push_back(std::move(record));
            PluginModule* module = m_modules.back().get();
            m_keyToPlugin[module->xmlPath] = module;
            status = JEX_SUCCESS;

            for (const std::string& type : module->targetNames) {
                m_typeToKey[type.c_str()] = module->xmlPath;
                m_targetTypes.push_back(type.c_str());
            }
        }
    }
    return status;
}

unsigned PluginManager::refreshTargetList()
{
    MethodLogger tracer;
    tracer.setMethodName("PluginManager::refreshTargetList");
    return tracer.setReturnStatus(addAllPlugins());
}

} // namespace JexRT
