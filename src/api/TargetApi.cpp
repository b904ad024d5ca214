// SPDX-License-Identifier: MIT
// Exported target functions: open and close, commands and options, pins,
// waiting and the target information record.

#include <algorithm>
#include <cstring>
#include <string>
#include <vector>

#include "api/ApiGuard.hpp"
#include "jexjtag/target.h"
#include "session/Session.hpp"
#include "session/SessionRegistry.hpp"
#include "target/Target.hpp"
#include "util/Jex_Util.hpp"
#include "util/Logger.hpp"
#include "util/MethodLogger.hpp"

using namespace JexRT;

namespace {

// "JEXJTAG_TDI" .. "JEXJTAG_TCK", or null for a pin without a name.
const char* pinName(unsigned pin)
{
    switch (pin) {
    case JEXJTAG_TDI: return "JEXJTAG_TDI";
    case JEXJTAG_TDO: return "JEXJTAG_TDO";
    case JEXJTAG_TMS: return "JEXJTAG_TMS";
    case JEXJTAG_TCK: return "JEXJTAG_TCK";
    default: return nullptr;
    }
}

const char* orNull(const char* text) { return text ? text : "NULL"; }

bool validArgv(unsigned argc, const char** argv)
{
    if (argc > 0 && !argv) return false;
    for (unsigned i = 0; i < argc; ++i)
        if (!argv[i]) return false;
    return true;
}

void traceInfo(const JexJtagTargetInfo& info)
{
    Logger& log = Logger::logger;
    log.printLog(3, "JexJtag_target_getInfo() returning info {\n");
    log.printLog(3, "    target_name=%s\n", info.target_name);
    log.printLog(3, "    plugin_name=%s\n", info.plugin_name);
    log.printLog(3, "    fw_ver=%s\n", info.fw_ver);
    log.printLog(3, "    driver_ver=%s\n", info.driver_ver);
    log.printLog(3, "    plugin_ver=%s\n", info.plugin_ver);
    log.printLog(3, "    vendor=%s\n", info.vendor);
    log.printLog(3, "    frequency=%s\n", info.frequency);
    log.printLog(3, "    port=%s\n", info.port);
    log.printLog(3, "    full_name=%s\n", info.full_name);
    log.printLog(3, "    target_uid=%s\n", info.target_uid);
    log.printLog(3, "    rawinfo=%s\n", info.rawinfo);
    log.printLog(3, "    target_flags=%#x\n", info.target_flags);
    log.printLog(3, "}\n");
}

// The plug-in fills the texts; a text that lacks its terminator must not
// make the trace read past its field.
void terminateTexts(JexJtagTargetInfo& info)
{
    for (char* text : {info.target_name, info.plugin_name, info.fw_ver, info.driver_ver, info.plugin_ver,
                       info.vendor, info.frequency, info.port, info.full_name, info.target_uid, info.rawinfo})
        text[JEXJTAG_INFO_TEXT_SIZE - 1] = '\0';
}

} // namespace

extern "C" {

JEXJTAG_API uint32_t JexJtag_target_open(unsigned handle, const char* targetName, void* callerData, unsigned argc,
                                         const char** argv, JexJtagTargetInfo* info)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_target_open");
    if (Logger::logger.isEnabled(3)) {
        Logger::logger.printLog(3, "JexJtag_target_open() handle=%u, targetName=%s, argc=%d\n", handle,
                                orNull(targetName), static_cast<int>(argc));
        if (argv)
            for (unsigned i = 0; i < argc; ++i)
                Logger::logger.printLog(3, "JexJtag_target_open() argv[%d]:%s\n", static_cast<int>(i), orNull(argv[i]));
    }
    const unsigned status = guardedCall("JexJtag_target_open", [&]() -> unsigned {
        // Only index 0 holds a target: any other low byte reaches none.
        Session* session = findSession(handle);
        const unsigned index = handle & JEX_HANDLE_TARGET_MASK;
        if (!session || index != 0 || !targetName || !validArgv(argc, argv)) return JEX_FAILURE;

        Target* target = session->getTarget(index);
        if (!target) target = session->createTarget(index);
        if (!target) return JEX_FAILURE;

        std::vector<std::string> args = getArgs(argc, argv);
        args.push_back(std::string("type=") + targetName);
        JexJtagCallContext context{handle, 0, callerData};
        const unsigned result = target->open(targetName, &context, args);
        // A callback may have closed the target or destroyed the session
        // meanwhile: only the target still in the slot is touched.
        if (session->getTarget(index) != target) return JEX_FAILED(result) ? result : JEX_FAILURE;
        if (JEX_FAILED(result)) {
            // Also when a target was open already: it is closed with its object.
            session->destroyTarget(index);
            return result;
        }

        JexJtagTargetInfo local;
        const unsigned infoStatus = target->getInfo(&local);
        const std::string avoid = Jex_Util::findKey(argc, argv, "AVOID_FIRMWARE_UPDATE");
        if (!avoid.empty() && Jex_Util::stricmp(avoid, "true") == 0 &&
            (local.target_flags & JEXJTAG_FLAG_NEW_FIRMWARE) != 0) {
            target->close();
            session->destroyTarget(index);
            Logger::logger.printLog(3, "JexJtag_target_open() -- Closing target because AVOID_FIRMWARE_UPDATE=TRUE is "
                                       "set and new firmware is available.\n");
        }
        if (!JEX_FAILED(infoStatus) && info) std::memcpy(info, &local, sizeof local);
        return result;
    });
    return tracer.setReturnStatus(status);
}

JEXJTAG_API uint32_t JexJtag_target_close(unsigned handle)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_target_close");
    Logger::logger.printLog(3, "JexJtag_target_close() handle=%u\n", handle);
    const unsigned status = guardedCall("JexJtag_target_close", [&]() -> unsigned {
        Target* target = findTarget(handle);
        if (!target) return JEX_FAILURE;
        Session* session = findSession(handle);
        const unsigned index = handle & JEX_HANDLE_TARGET_MASK;
        // From a callback the target may be in the middle of a call: it
        // leaves the slot now and is closed when that call returns.
        if (ApiCallScope::nested()) {
            session->destroyTarget(index);
            return JEX_SUCCESS;
        }
        const unsigned result = target->close();
        if (session->getTarget(index) == target) session->destroyTarget(index);
        return result;
    });
    return tracer.setReturnStatus(status);
}

JEXJTAG_API uint32_t JexJtag_target_sendCommand(unsigned handle, const char* cmd, const unsigned char* inbuf,
                                                unsigned inbuflen, unsigned char* outbuf, unsigned* outbuflen,
                                                void* callerData)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_target_sendCommand");
    if (Logger::logger.isEnabled(3))
        Logger::logger.printLog(3, "JexJtag_target_sendCommand() handle=%u, cmd=%s, inbuflen=%u, outbuflen=%u\n",
                                handle, orNull(cmd), inbuflen, outbuflen ? *outbuflen : 0u);
    const unsigned status = guardedCall("JexJtag_target_sendCommand", [&]() -> unsigned {
        Target* target = findTarget(handle);
        if (!target || !cmd) return JEX_FAILURE;
        JexJtagCallContext context{handle, 0, callerData};
        return target->sendCommand(cmd, inbuf, inbuflen, outbuf, outbuflen, &context);
    });
    return tracer.setReturnStatus(status);
}

JEXJTAG_API uint32_t JexJtag_target_setOption(unsigned handle, const char* key, const char* value)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_target_setOption");
    if (Logger::logger.isEnabled(3))
        Logger::logger.printLog(3, "JexJtag_target_setOption() handle=%u, key=%s, value=%s\n", handle, orNull(key),
                                orNull(value));
    const unsigned status = guardedCall("JexJtag_target_setOption", [&]() -> unsigned {
        Target* target = findTarget(handle);
        if (!target || !key || !value) return JEX_FAILURE;
        return target->setOption(key, value);
    });
    return tracer.setReturnStatus(status);
}

JEXJTAG_API uint32_t JexJtag_target_getOption(unsigned handle, const char* key, char* value, unsigned* valuesize)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_target_getOption");
    if (Logger::logger.isEnabled(3))
        Logger::logger.printLog(3, "JexJtag_target_getOption() handle=%u, key=%s, valuesize=%u\n", handle, orNull(key),
                                valuesize ? *valuesize : 0u);
    const unsigned status = guardedCall("JexJtag_target_getOption", [&]() -> unsigned {
        Target* target = findTarget(handle);
        if (!target || !key || !value || !valuesize || *valuesize == 0) return JEX_FAILURE;

        // The plug-in may rewrite the word: the caller's capacity is what
        // was passed in, and the copy stays within it.
        const unsigned capacity = *valuesize;
        std::string text;
        const unsigned result = target->getOption(key, text, valuesize);
        if (JEX_FAILED(result)) return result;

        const unsigned reported = *valuesize;
        std::memset(value, 0, capacity);
        std::memcpy(value, text.data(), std::min<size_t>(text.size(), capacity - 1));
        // The option's full length: the text received, or the longer length
        // the plug-in reported when the text filled the buffer it was given.
        size_t full = text.size();
        if (text.size() + 1 >= capacity && reported > full) full = reported;
        *valuesize = static_cast<unsigned>(full);
        Logger::logger.printLog(3, "JexJtag_target_getOption() returning value=%s, valuesize=%u\n", value, *valuesize);
        return result;
    });
    return tracer.setReturnStatus(status);
}

JEXJTAG_API uint32_t JexJtag_target_flush(unsigned handle)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_target_flush");
    Logger::logger.printLog(3, "JexJtag_target_flush() handle=%u\n", handle);
    const unsigned status = guardedCall("JexJtag_target_flush", [&]() -> unsigned {
        Target* target = findTarget(handle);
        return target ? target->flush() : JEX_FAILURE;
    });
    return tracer.setReturnStatus(status);
}

JEXJTAG_API uint32_t JexJtag_target_setPin(unsigned handle, unsigned pin, unsigned value)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_target_setPin");
    if (Logger::logger.isEnabled(3)) {
        if (const char* name = pinName(pin))
            Logger::logger.printLog(3, "JexJtag_target_setPin() handle=%u, pin=%s, value=%u\n", handle, name, value);
        else
            Logger::logger.printLog(3, "JexJtag_target_setPin() handle=%u, pin=%u, value=%u\n", handle, pin, value);
    }
    const unsigned status = guardedCall("JexJtag_target_setPin", [&]() -> unsigned {
        Target* target = findTarget(handle);
        return target ? target->setPin(pin, value) : JEX_FAILURE;
    });
    return tracer.setReturnStatus(status);
}

JEXJTAG_API uint32_t JexJtag_target_getPin(unsigned handle, unsigned pin, unsigned* value)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_target_getPin");
    if (Logger::logger.isEnabled(3)) {
        if (const char* name = pinName(pin))
            Logger::logger.printLog(3, "JexJtag_target_getPin() handle=%u, pin=%s\n", handle, name);
        else
            Logger::logger.printLog(3, "JexJtag_target_getPin() handle=%u, pin=%u\n", handle, pin);
    }
    const unsigned status = guardedCall("JexJtag_target_getPin", [&]() -> unsigned {
        Target* target = findTarget(handle);
        if (!target || !value) return JEX_FAILURE;
        const unsigned result = target->getPin(pin, value);
        if (!JEX_FAILED(result)) Logger::logger.printLog(3, "JexJtag_target_getPin() returning value=%u\n", *value);
        return result;
    });
    return tracer.setReturnStatus(status);
}

JEXJTAG_API uint32_t JexJtag_target_pulsePin(unsigned handle, unsigned pin, unsigned count)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_target_pulsePin");
    if (Logger::logger.isEnabled(3)) {
        if (const char* name = pinName(pin))
            Logger::logger.printLog(3, "JexJtag_target_pulsePin() handle=%u, pin=%s, count=%u\n", handle, name, count);
        else
            Logger::logger.printLog(3, "JexJtag_target_pulsePin() handle=%u, pin=%u, count=%u\n", handle, pin, count);
    }
    const unsigned status = guardedCall("JexJtag_target_pulsePin", [&]() -> unsigned {
        Target* target = findTarget(handle);
        return target ? target->pulsePin(pin, count) : JEX_FAILURE;
    });
    return tracer.setReturnStatus(status);
}

JEXJTAG_API uint32_t JexJtag_target_waitTime(unsigned handle, unsigned us)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_target_waitTime");
    Logger::logger.printLog(3, "JexJtag_target_waitTime() handle=%u, us=%u\n", handle, us);
    const unsigned status = guardedCall("JexJtag_target_waitTime", [&]() -> unsigned {
        Target* target = findTarget(handle);
        return target ? target->waitTime(us) : JEX_FAILURE;
    });
    return tracer.setReturnStatus(status);
}

JEXJTAG_API uint32_t JexJtag_target_getInfo(unsigned handle, JexJtagTargetInfo* info)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_target_getInfo");
    Logger::logger.printLog(3, "JexJtag_target_getInfo() handle=%u\n", handle);
    const unsigned status = guardedCall("JexJtag_target_getInfo", [&]() -> unsigned {
        Target* target = findTarget(handle);
        if (!target) return JEX_FAILURE;
        JexJtagTargetInfo local;
        const unsigned result = target->getInfo(&local);
        if (JEX_FAILED(result) || !info) return JEX_FAILURE;
        std::memcpy(info, &local, sizeof local);
        if (Logger::logger.isEnabled(3)) {
            terminateTexts(local);
            traceInfo(local);
        }
        return result;
    });
    return tracer.setReturnStatus(status);
}

} // extern "C"
