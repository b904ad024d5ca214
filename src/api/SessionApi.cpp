// SPDX-License-Identifier: MIT
// Exported session functions: version, create and destroy, the plug-in
// search path, the target list, and messages to the host.

#include <algorithm>
#include <cstdio>
#include <cstring>
#include <string>

#include "api/ApiGuard.hpp"
#include "jexjtag/session.h"
#include "session/Session.hpp"
#include "session/SessionRegistry.hpp"
#include "util/Logger.hpp"
#include "util/MethodLogger.hpp"
#include "util/Version.hpp"

using namespace JexRT;

namespace {

constexpr unsigned kVersionTextSize = 128;

// Copies text into buf of size bytes: zero-filled, cut to size - 1.
void copyCut(char* buf, unsigned size, const std::string& text)
{
    std::memset(buf, 0, size);
    std::memcpy(buf, text.data(), std::min<size_t>(text.size(), size - 1));
}

} // namespace

extern "C" {

JEXJTAG_API uint32_t JexJtag_session_getAPIVersion(unsigned* version, char* versionString, unsigned versionLen)
{
    Logger::logger.startLogging();
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_session_getAPIVersion");
    if (version) *version = versionNumberFromText(getVersionNumber());
    if (versionLen < kVersionTextSize) {
        Logger::logger.printLog(1, "JexJtag_session_getAPIVersion() -  versionLen is too small\n");
        return tracer.setReturnStatus(JEX_FAILURE);
    }
    if (!versionString) return tracer.setReturnStatus(JEX_SUCCESS);
    std::memset(versionString, 0, kVersionTextSize);
    std::snprintf(versionString, kVersionTextSize, "Version %s", getVersionWithBuildNumber());
    return tracer.setReturnStatus(JEX_SUCCESS);
}

JEXJTAG_API uint32_t JexJtag_session_create(JexMessageCallback msgCallback, unsigned argc, const char** argv,
                                            unsigned* handle)
{
    Logger::logger.startLogging();
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_session_create");
    const unsigned status = guardedCall("JexJtag_session_create", [&]() -> unsigned {
        Logger::logger.printLog(3, "JexJtag_session_create() argc=%d\n", static_cast<int>(argc));
        if (Logger::logger.isEnabled(3) && argv)
            for (unsigned i = 0; i < argc; ++i)
                Logger::logger.printLog(3, "JexJtag_session_create() argv[%d]:%s\n", static_cast<int>(i),
                                        argv[i] ? argv[i] : "NULL");
        const unsigned result = createSession(msgCallback, argc, argv, handle);
        if (!JEX_FAILED(result))
            Logger::logger.printLog(3, "JexJtag_session_create() returning handle=%u\n", *handle);
        return result;
    });
    return tracer.setReturnStatus(status);
}

JEXJTAG_API uint32_t JexJtag_session_destroy(unsigned handle)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_session_destroy");
    Logger::logger.printLog(3, "JexJtag_session_destroy() handle=%u\n", handle);
    return tracer.setReturnStatus(guardedCall("JexJtag_session_destroy", [&] { return destroySession(handle); }));
}

JEXJTAG_API uint32_t JexJtag_session_sendMessage(unsigned handle, unsigned msgType, const char* text)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_session_sendMessage");
    const char* shown = text ? text : "NULL";
    switch (msgType) {
    case JEX_MSG_ERROR:
        Logger::logger.printLog(1, "JexJtag_session_sendMessage() handle=%u, msgType=JEX_MSG_ERROR: %s\n", handle, shown);
        break;
    case JEX_MSG_WARNING:
        Logger::logger.printLog(1, "JexJtag_session_sendMessage() handle=%u, msgType=JEX_MSG_WARNING: %s\n", handle, shown);
        break;
    case JEX_MSG_STATUS:
        Logger::logger.printLog(2, "JexJtag_session_sendMessage() handle=%u, msgType=JEX_MSG_STATUS: %s\n", handle, shown);
        break;
    case JEX_MSG_INFO:
        Logger::logger.printLog(2, "JexJtag_session_sendMessage() handle=%u, msgType=JEX_MSG_INFO: %s\n", handle, shown);
        break;
    case JEX_MSG_NOISE:
        Logger::logger.printLog(2, "JexJtag_session_sendMessage() handle=%u, msgType=JEX_MSG_NOISE: %s\n", handle, shown);
        break;
    default:
        Logger::logger.printLog(2, "JexJtag_session_sendMessage() handle=%u, msgType=JEX_MSG_DEBUG(%u): %s\n", handle,
                                msgType, shown);
        break;
    }
    const unsigned status = guardedCall("JexJtag_session_sendMessage", [&]() -> unsigned {
        Session* session = findSession(handle);
        if (!session || !text) return JEX_FAILURE;
        session->sendMessage(msgType, text);
        return JEX_SUCCESS;
    });
    return tracer.setReturnStatus(status);
}

JEXJTAG_API uint32_t JexJtag_session_setPluginSearchPath(unsigned handle, const char* path)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_session_setPluginSearchPath");
    Logger::logger.printLog(3, "JexJtag_session_setPluginSearchPath() handle=%u, path=%s\n", handle,
                            path ? path : "NULL");
    const unsigned status = guardedCall("JexJtag_session_setPluginSearchPath", [&]() -> unsigned {
        Session* session = findSession(handle);
        if (!session || !path) return JEX_FAILURE;
        session->setPluginSearchPath(path);
        return JEX_SUCCESS;
    });
    return tracer.setReturnStatus(status);
}

JEXJTAG_API uint32_t JexJtag_session_getPluginSearchPath(unsigned handle, char* path, unsigned pathsize)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_session_getPluginSearchPath");
    Logger::logger.printLog(3, "JexJtag_session_getPluginSearchPath() handle=%u, pathsize=%u\n", handle, pathsize);
    const unsigned status = guardedCall("JexJtag_session_getPluginSearchPath", [&]() -> unsigned {
        Session* session = findSession(handle);
        if (!session || !path) return JEX_FAILURE;
        const std::string stored = session->getPluginSearchPath();
        if (pathsize <= stored.size()) return JEX_FAILURE;
        std::memcpy(path, stored.c_str(), stored.size() + 1);
        Logger::logger.printLog(3, "JexJtag_session_getPluginSearchPath() returning path=%s\n", path);
        return JEX_SUCCESS;
    });
    return tracer.setReturnStatus(status);
}

JEXJTAG_API uint32_t JexJtag_session_refreshTargetList(unsigned handle)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_session_refreshTargetList");
    Logger::logger.printLog(3, "JexJtag_session_refreshTargetList() handle=%u\n", handle);
    const unsigned status = guardedCall("JexJtag_session_refreshTargetList", [&]() -> unsigned {
        Session* session = findSession(handle);
        if (!session) return JEX_FAILURE;
        session->refreshTargetList(); // success whatever the refresh found
        return JEX_SUCCESS;
    });
    return tracer.setReturnStatus(status);
}

JEXJTAG_API uint32_t JexJtag_session_getTargetCount(unsigned handle, unsigned* count)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_session_getTargetCount");
    Logger::logger.printLog(3, "JexJtag_session_getTargetCount() handle=%u\n", handle);
    const unsigned status = guardedCall("JexJtag_session_getTargetCount", [&]() -> unsigned {
        Session* session = findSession(handle);
        if (!session) return JEX_FAILURE;
        const unsigned n = session->getTargetCount();
        if (!count) return JEX_FAILURE;
        *count = n;
        Logger::logger.printLog(3, "JexJtag_session_getTargetCount() returning count=%u\n", n);
        return JEX_SUCCESS;
    });
    return tracer.setReturnStatus(status);
}

JEXJTAG_API uint32_t JexJtag_session_getTargetXMLSizeByIndex(unsigned handle, unsigned targetIdx,
                                                             unsigned* xmlBufSize)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_session_getTargetXMLSizeByIndex");
    Logger::logger.printLog(3, "JexJtag_session_getTargetXMLSizeByIndex() handle=%u, targetIdx=%u\n", handle,
                            targetIdx);
    const unsigned status = guardedCall("JexJtag_session_getTargetXMLSizeByIndex", [&]() -> unsigned {
        Session* session = findSession(handle);
        if (!session) return JEX_FAILURE;
        const unsigned size = session->getTargetXMLSizeByIndex(targetIdx);
        if (!xmlBufSize) return JEX_FAILURE;
        *xmlBufSize = size;
        Logger::logger.printLog(3, "JexJtag_session_getTargetXMLSizeByIndex() returning xmlBufSize=%u\n", size);
        return JEX_SUCCESS;
    });
    return tracer.setReturnStatus(status);
}

JEXJTAG_API uint32_t JexJtag_session_getTargetByIndex(unsigned handle, unsigned targetIdx, char* xmlBuf,
                                                      unsigned xmlBufLen, char* targetName, unsigned targetNameLen,
                                                      char* pluginName, unsigned pluginNameLen)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_session_getTargetByIndex");
    Logger::logger.printLog(3,
                            "JexJtag_session_getTargetByIndex() handle=%u, targetIdx=%u, xmlBufLen=%u, "
                            "targetNameLen=%u, pluginNameLen=%u\n",
                            handle, targetIdx, xmlBufLen, targetNameLen, pluginNameLen);
    const unsigned status = guardedCall("JexJtag_session_getTargetByIndex", [&]() -> unsigned {
        Session* session = findSession(handle);
        if (!session || !xmlBuf || xmlBufLen == 0 || !targetName || !pluginName || targetNameLen == 0 ||
            pluginNameLen == 0)
            return JEX_FAILURE;
        std::string name;
        std::string plugin;
        const unsigned result = session->getTargetByIndex(targetIdx, xmlBuf, xmlBufLen, &name, &plugin);
        if (JEX_FAILED(result)) return result;
        copyCut(targetName, targetNameLen, name);
        copyCut(pluginName, pluginNameLen, plugin);
        Logger::logger.printLog(3, "JexJtag_session_getTargetByIndex() returning targetName=%s, pluginName=%s\n",
                                name.c_str(), plugin.c_str());
        return result;
    });
    return tracer.setReturnStatus(status);
}

} // extern "C"
