// SPDX-License-Identifier: MIT
// PluginManager: the target list as hosts see it.  The description of a
// target is its plug-in's descriptor file, read whole at each call.

#include <cstdio>
#include <cstring>
#include <limits>

#include "plugin/PluginManager.hpp"
#include "util/Logger.hpp"
#include "util/MethodLogger.hpp"

namespace JexRT {

namespace {

// Closes a C file at the end of the scope.
struct FileCloser {
    std::FILE* file;
    ~FileCloser()
    {
        if (file) std::fclose(file);
    }
};

} // namespace

unsigned PluginManager::getTargetCount()
{
    MethodLogger tracer;
    tracer.setMethodName("PluginManager::getTargetCount");
    std::lock_guard<std::recursive_mutex> lock(m_mutex);
    const unsigned count = static_cast<unsigned>(m_targetTypes.size());
    tracer.setReturn(count);
    return count;
}

const PluginModule* PluginManager::moduleAt(unsigned index, const char* who) const
{
    const char* type = m_targetTypes[index];
    if (!type) {
        Logger::logger.printLog(1, "PluginManager::%s() - type is 0!\n", who);
        return nullptr;
    }
    const auto key = m_typeToKey.find(type);
    if (key == m_typeToKey.end() || key->second.empty()) {
        Logger::logger.printLog(1, "PluginManager::%s() - key is 0!\n", who);
        return nullptr;
    }
    const auto plugin = m_keyToPlugin.find(key->second);
    if (plugin == m_keyToPlugin.end() || !plugin->second) {
        Logger::logger.printLog(1, "PluginManager::%s() - plugin is 0!\n", who);
        return nullptr;
    }
    return plugin->second;
}

unsigned PluginManager::getXMLSizeByIndex(unsigned index)
{
    MethodLogger tracer;
    tracer.setMethodName("PluginManager::getXMLSizeByIndex");
    std::lock_guard<std::recursive_mutex> lock(m_mutex);
    tracer.setReturn(0);
    if (index >= getTargetCount()) {
        Logger::logger.printLog(1, "PluginManager::getXMLSizeByIndex() - Invalid argument\n");
        return 0;
    }
    const PluginModule* module = moduleAt(index, "getXMLSizeByIndex");
    if (!module) return 0;

    FileCloser xml {std::fopen(module->xmlPath.c_str(), "r")};
    if (!xml.file) return 0;
    if (std::fseek(xml.file, 0, SEEK_END) != 0) return 0;
    const long end = std::ftell(xml.file);
    // An empty file, an error, or a size the 32-bit result cannot carry.
    if (end <= 0 || static_cast<unsigned long>(end) >= std::numeric_limits<unsigned>::max()) return 0;
    const unsigned size = static_cast<unsigned>(end) + 1;
    tracer.setReturn(size);
    return size;
}

unsigned PluginManager::getTargetByIndex(unsigned index, char* xmlBuf, unsigned xmlBufLen, std::string* targetName,
                                         std::string* pluginName)
{
    MethodLogger tracer;
    tracer.setMethodName("PluginManager::getTargetByIndex");
    std::lock_guard<std::recursive_mutex> lock(m_mutex);
    if (index >= getTargetCount() || !xmlBuf || xmlBufLen == 0 || !targetName || !pluginName) {
        Logger::logger.printLog(1, "PluginManager::getTargetByIndex() - Invalid argument\n");
        return tracer.setReturnStatus(JEX_FAILURE);
    }
    const PluginModule* module = moduleAt(index, "getTargetByIndex");
    if (!module) return tracer.setReturnStatus(JEX_FAILURE);

    FileCloser xml {std::fopen(module->xmlPath.c_str(), "r")};
    if (!xml.file) return tracer.setReturnStatus(JEX_FAILURE);

    // The buffer always ends up holding a zero-terminated text: the whole
    // file when it fits in xmlBufLen - 1 bytes, else that many first bytes.
    std::memset(xmlBuf, 0, xmlBufLen);
    const unsigned readCount = static_cast<unsigned>(std::fread(xmlBuf, xmlBufLen - 1, 1, xml.file));

    *targetName = m_targetTypes[index];
    *pluginName = module->name;
    Logger::logger.printLog(2, "PluginManager::getTargetByIndex() - readCount=%u\n", readCount);
    return tracer.setReturnStatus(JEX_SUCCESS);
}

} // namespace JexRT
