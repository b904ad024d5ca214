// SPDX-License-Identifier: MIT
#include "plugin/PluginHostCallbacks.hpp"

#include "session/Session.hpp"
#include "session/SessionRegistry.hpp"
#include "util/Logger.hpp"

namespace JexRT {

namespace {

// Delivered to the session that owns the handle; dropped when there is none.
void hostSendMessage(uint32_t sessionHandle, uint32_t msgType, const char* text)
{
    if (!text) return;
    try {
        if (Session* session = findSession(sessionHandle)) session->sendMessage(msgType, text);
    } catch (...) {
        Logger::logger.printLog(1, "Plug-in message for session %u could not be delivered\n", sessionHandle);
    }
}

void hostVprintLog(int level, const char* format, va_list args)
{
    if (format) Logger::logger.vprintLog(level, format, args);
}

void hostDumpBuffer(int level, const char* label, const uint8_t* bytes, uint32_t length)
{
    Logger::logger.dumpBuffer(level, label, bytes, length);
}

void hostLogMethodEntry(const char* name) { Logger::logger.logMethodEntry(name); }

void hostLogMethodExit(const char* name) { Logger::logger.logMethodExit(name); }

} // namespace

JexPluginCallbacks makePluginHostCallbacks()
{
    JexPluginCallbacks table {};
    table.sendMessage = hostSendMessage;
    table.vprintLog = hostVprintLog;
    table.dumpBuffer = hostDumpBuffer;
    table.logMethodEntry = hostLogMethodEntry;
    table.logMethodExit = hostLogMethodExit;
    return table;
}

} // namespace JexRT
