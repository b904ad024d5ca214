// SPDX-License-Identifier: MIT
// Exported TAP functions: chain configuration, navigation and the four
// register shifts.

#include <algorithm>
#include <cstring>
#include <string>

#include "api/ApiGuard.hpp"
#include "api/IdcodeText.hpp"
#include "jexjtag/rt/IDCode.hpp"
#include "jexjtag/tap.h"
#include "session/SessionRegistry.hpp"
#include "target/TapStateText.hpp"
#include "target/Target.hpp"
#include "util/Logger.hpp"
#include "util/MethodLogger.hpp"

using namespace JexRT;

namespace {

// "JEXJTAG_SCAN_DEFAULT" .. "JEXJTAG_SCAN_WALKING_ONES", or null.
const char* algorithmName(unsigned algorithm)
{
    switch (algorithm) {
    case JEXJTAG_SCAN_DEFAULT: return "JEXJTAG_SCAN_DEFAULT";
    case JEXJTAG_SCAN_TLRSHIFT: return "JEXJTAG_SCAN_TLRSHIFT";
    case JEXJTAG_SCAN_WALKING_ONES: return "JEXJTAG_SCAN_WALKING_ONES";
    default: return nullptr;
    }
}

void traceAlgorithm(const char* function, unsigned handle, unsigned algorithm)
{
    if (const char* name = algorithmName(algorithm))
        Logger::logger.printLog(3, "%s() handle=%u, algorithm=%s\n", function, handle, name);
    else
        Logger::logger.printLog(3, "%s() handle=%u, algorithm=%u\n", function, handle, algorithm);
}

// A state by its enumeration name: the table's names, JEXJTAG_STATE_SIZE
// for 16, "unknown(N)" past that.
void traceState(const char* function, const char* field, unsigned state)
{
    if (state == JEXJTAG_STATE_SIZE)
        Logger::logger.printLog(3, "%s() %s=JEXJTAG_STATE_SIZE\n", function, field);
    else
        Logger::logger.printLog(3, "%s() %s=%s\n", function, field, TapStateText(state).c_str());
}

void traceShiftMode(const char* function, unsigned shiftMode)
{
    switch (shiftMode) {
    case JEXJTAG_SHIFT_READ: Logger::logger.printLog(3, "%s() shiftMode=JEXJTAG_SHIFT_READ\n", function); break;
    case JEXJTAG_SHIFT_WRITE: Logger::logger.printLog(3, "%s() shiftMode=JEXJTAG_SHIFT_WRITE\n", function); break;
    case JEXJTAG_SHIFT_READWRITE:
        Logger::logger.printLog(3, "%s() shiftMode=JEXJTAG_SHIFT_READWRITE\n", function);
        break;
    default: Logger::logger.printLog(3, "%s() shiftMode=unknown(%u)\n", function, shiftMode); break;
    }
}

// Copies text into buf: at most len characters, the rest NUL-filled (no
// terminator when the text fills the buffer).
void copyFilled(char* buf, unsigned len, const std::string& text)
{
    if (!buf || len == 0) return;
    const size_t n = std::min<size_t>(text.size(), len);
    std::memcpy(buf, text.data(), n);
    std::memset(buf + n, 0, len - n);
}

enum class Shift { ChainIR, DeviceIR, ChainDR, DeviceDR };

const char* const kShiftFunctions[] = {"JexJtag_tap_shiftChainIR", "JexJtag_tap_shiftDeviceIR",
                                       "JexJtag_tap_shiftChainDR", "JexJtag_tap_shiftDeviceDR"};

// The common path of the four exported shifts.
unsigned shiftThrough(Shift which, unsigned handle, unsigned deviceIndex, unsigned shiftMode, unsigned exitState,
                      void* callerData, unsigned bitCount, const unsigned char* tdibuf, unsigned char* tdobuf,
                      const unsigned char* tdimask, const unsigned char* tdomask)
{
    const char* function = kShiftFunctions[static_cast<int>(which)];
    const bool device = which == Shift::DeviceIR || which == Shift::DeviceDR;
    MethodLogger tracer;
    tracer.setMethodName(function);
    if (Logger::logger.isEnabled(3)) {
        if (device)
            Logger::logger.printLog(3, "%s() handle=%u, deviceIndex=%u, bitCount=%u\n", function, handle, deviceIndex,
                                    bitCount);
        else
            Logger::logger.printLog(3, "%s() handle=%u, bitCount=%u\n", function, handle, bitCount);
        traceShiftMode(function, shiftMode);
        traceState(function, "exitState", exitState);
    }
    if (bitCount == 0) {
        // Nothing to shift: move the TAP to the exit state instead.
        Logger::logger.printLog(1, "Warning: bitCount = 0, using JexJtag_tap_navigate() instead.\n");
        return tracer.setReturnStatus(JexJtag_tap_navigate(handle, exitState, 0, 0));
    }
    const unsigned status = guardedCall(function, [&]() -> unsigned {
        Target* target = findTarget(handle);
        if (!target) return JEX_FAILURE;
        JexJtagCallContext context{handle, 0, callerData};
        switch (which) {
        case Shift::ChainIR:
            return target->shiftChainIR(tdibuf, tdobuf, bitCount, tdimask, tdomask, shiftMode, exitState, &context);
        case Shift::DeviceIR:
            return target->shiftDeviceIR(deviceIndex, tdibuf, tdobuf, bitCount, tdimask, tdomask, shiftMode,
                                         exitState, &context);
        case Shift::ChainDR:
            return target->shiftChainDR(tdibuf, tdobuf, bitCount, tdimask, tdomask, shiftMode, exitState, &context);
        case Shift::DeviceDR:
            return target->shiftDeviceDR(deviceIndex, tdibuf, tdobuf, bitCount, tdimask, tdomask, shiftMode,
                                         exitState, &context);
        }
        return JEX_FAILURE;
    });
    return tracer.setReturnStatus(status);
}

} // namespace

extern "C" {

JEXJTAG_API uint32_t JexJtag_tap_autodetectChain(unsigned handle, unsigned algorithm)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_tap_autodetectChain");
    if (Logger::logger.isEnabled(3)) {
        traceAlgorithm("JexJtag_tap_autodetectChain", handle, algorithm);
        Logger::logger.printLog(3, "JexJtag_tap_autodetectChain() handle=%u\n", handle);
    }
    const unsigned status = guardedCall("JexJtag_tap_autodetectChain", [&]() -> unsigned {
        Target* target = findTarget(handle);
        return target ? target->autodetect(algorithm) : JEX_FAILURE;
    });
    return tracer.setReturnStatus(status);
}

JEXJTAG_API uint32_t JexJtag_tap_interrogateChain(unsigned handle, unsigned algorithm)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_tap_interrogateChain");
    if (Logger::logger.isEnabled(3)) traceAlgorithm("JexJtag_tap_interrogateChain", handle, algorithm);
    const unsigned status = guardedCall("JexJtag_tap_interrogateChain", [&]() -> unsigned {
        Target* target = findTarget(handle);
        return target ? target->interrogate(algorithm) : JEX_FAILURE;
    });
    return tracer.setReturnStatus(status);
}

JEXJTAG_API uint32_t JexJtag_tap_getDeviceCount(unsigned handle, unsigned* count)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_tap_getDeviceCount");
    Logger::logger.printLog(3, "JexJtag_tap_getDeviceCount() handle=%u\n", handle);
    const unsigned status = guardedCall("JexJtag_tap_getDeviceCount", [&]() -> unsigned {
        Target* target = findTarget(handle);
        if (!target || !count) return JEX_FAILURE;
        const unsigned result = target->getDeviceCount(count);
        if (!JEX_FAILED(result)) Logger::logger.printLog(3, "JexJtag_tap_getDeviceCount() returning count=%u\n", *count);
        return result;
    });
    return tracer.setReturnStatus(status);
}

JEXJTAG_API uint32_t JexJtag_tap_setDeviceCount(unsigned handle, unsigned count)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_tap_setDeviceCount");
    Logger::logger.printLog(3, "JexJtag_tap_setDeviceCount() handle=%u, count=%u\n", handle, count);
    const unsigned status = guardedCall("JexJtag_tap_setDeviceCount", [&]() -> unsigned {
        Target* target = findTarget(handle);
        return target ? target->setDeviceCount(count) : JEX_FAILURE;
    });
    return tracer.setReturnStatus(status);
}

JEXJTAG_API uint32_t JexJtag_tap_getBypassCmd(unsigned handle, unsigned deviceIndex, char* bypassbuf,
                                              unsigned bypassbufLen)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_tap_getBypassCmd");
    Logger::logger.printLog(3, "JexJtag_tap_getBypassCmd() handle=%u, deviceIndex=%u, bypassbufLen=%u\n", handle,
                            deviceIndex, bypassbufLen);
    const unsigned status = guardedCall("JexJtag_tap_getBypassCmd", [&]() -> unsigned {
        Target* target = findTarget(handle);
        if (!target || (!bypassbuf && bypassbufLen != 0)) return JEX_FAILURE;
        std::string text;
        const unsigned result = target->getBypassCmd(deviceIndex, text);
        // Copied whatever the status: a failed call leaves the buffer cleared.
        copyFilled(bypassbuf, bypassbufLen, text);
        if (!JEX_FAILED(result) && bypassbuf && Logger::logger.isEnabled(3))
            Logger::logger.printLog(3, "JexJtag_tap_getBypassCmd() returning cmd_bypass=%.*s\n",
                                    static_cast<int>(strnlen(bypassbuf, bypassbufLen)), bypassbuf);
        return result;
    });
    return tracer.setReturnStatus(status);
}

JEXJTAG_API uint32_t JexJtag_tap_setBypassCmd(unsigned handle, unsigned deviceIndex, const char* cmd_bypass)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_tap_setBypassCmd");
    Logger::logger.printLog(3, "JexJtag_tap_setBypassCmd() handle=%u, deviceIndex=%u, cmd_bypass=%s\n", handle,
                            deviceIndex, cmd_bypass ? cmd_bypass : "NULL");
    const unsigned status = guardedCall("JexJtag_tap_setBypassCmd", [&]() -> unsigned {
        Target* target = findTarget(handle);
        if (!target || !cmd_bypass) return JEX_FAILURE;
        return target->setBypassCmd(deviceIndex, cmd_bypass);
    });
    return tracer.setReturnStatus(status);
}

JEXJTAG_API uint32_t JexJtag_tap_getIRLength(unsigned handle, unsigned deviceIndex, unsigned* irlen)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_tap_getIRLength");
    Logger::logger.printLog(3, "JexJtag_tap_getIRLength() handle=%u, deviceIndex=%u\n", handle, deviceIndex);
    if (irlen) *irlen = 0;
    const unsigned status = guardedCall("JexJtag_tap_getIRLength", [&]() -> unsigned {
        Target* target = findTarget(handle);
        if (!target || !irlen) return JEX_FAILURE;
        const unsigned result = target->getIRLength(deviceIndex, irlen);
        if (!JEX_FAILED(result)) Logger::logger.printLog(3, "JexJtag_tap_getIRLength() returning irlen=%u\n", *irlen);
        return result;
    });
    return tracer.setReturnStatus(status);
}

JEXJTAG_API uint32_t JexJtag_tap_setIRLength(unsigned handle, unsigned deviceIndex, unsigned irlen)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_tap_setIRLength");
    Logger::logger.printLog(3, "JexJtag_tap_setIRLength() handle=%u, deviceIndex=%u, irlen=%u\n", handle, deviceIndex,
                            irlen);
    const unsigned status = guardedCall("JexJtag_tap_setIRLength", [&]() -> unsigned {
        Target* target = findTarget(handle);
        return target ? target->setIRLength(deviceIndex, irlen) : JEX_FAILURE;
    });
    return tracer.setReturnStatus(status);
}

JEXJTAG_API uint32_t JexJtag_tap_getDeviceIdcode(unsigned handle, unsigned deviceIndex, char* idcode,
                                                 unsigned idcodeLen)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_tap_getDeviceIdcode");
    Logger::logger.printLog(3, "JexJtag_tap_getDeviceIdcode() handle=%u, deviceIndex=%u, idcodeLen=%u\n", handle,
                            deviceIndex, idcodeLen);
    if (idcode && idcodeLen) std::memset(idcode, 0, idcodeLen);
    const unsigned status = guardedCall("JexJtag_tap_getDeviceIdcode", [&]() -> unsigned {
        Target* target = findTarget(handle);
        if (!target) return JEX_FAILURE;
        IDCode code;
        const unsigned result = target->getDeviceIdcode(deviceIndex, code);
        if (JEX_FAILED(result)) return result;
        copyFilled(idcode, idcodeLen, code.getIDCode());
        if (idcode && Logger::logger.isEnabled(3))
            Logger::logger.printLog(3, "JexJtag_tap_getDeviceIdcode() returning idcode=%.*s\n",
                                    static_cast<int>(strnlen(idcode, idcodeLen)), idcode);
        return result;
    });
    return tracer.setReturnStatus(status);
}

JEXJTAG_API uint32_t JexJtag_tap_setDeviceIdcode(unsigned handle, unsigned deviceIndex, const char* idcode)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_tap_setDeviceIdcode");
    Logger::logger.printLog(3, "JexJtag_tap_setDeviceIdcode() handle=%u, deviceIndex=%u, idcode=%s\n", handle,
                            deviceIndex, idcode ? idcode : "NULL");
    const unsigned status = guardedCall("JexJtag_tap_setDeviceIdcode", [&]() -> unsigned {
        Target* target = findTarget(handle);
        if (!target || !isIdcodeText(idcode)) return JEX_FAILURE;
        return target->setDeviceIdcode(deviceIndex, IDCode(std::string(idcode)));
    });
    return tracer.setReturnStatus(status);
}

JEXJTAG_API uint32_t JexJtag_tap_navigate(unsigned handle, unsigned newState, unsigned clockRepeat,
                                          unsigned microSeconds)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_tap_navigate");
    if (Logger::logger.isEnabled(3)) {
        Logger::logger.printLog(3, "JexJtag_tap_navigate() handle=%u, clockRepeat=%u, microSeconds=%u\n", handle,
                                clockRepeat, microSeconds);
        traceState("JexJtag_tap_navigate", "newState", newState);
    }
    const unsigned status = guardedCall("JexJtag_tap_navigate", [&]() -> unsigned {
        Target* target = findTarget(handle);
        return target ? target->navigate(newState, clockRepeat, microSeconds) : JEX_FAILURE;
    });
    return tracer.setReturnStatus(status);
}

JEXJTAG_API uint32_t JexJtag_tap_shiftChainIR(unsigned handle, unsigned shiftMode, unsigned exitState,
                                              void* callerData, unsigned bitCount, const unsigned char* tdibuf,
                                              unsigned char* tdobuf, const unsigned char* tdimask,
                                              const unsigned char* tdomask)
{
    return shiftThrough(Shift::ChainIR, handle, 0, shiftMode, exitState, callerData, bitCount, tdibuf, tdobuf, tdimask,
                        tdomask);
}

JEXJTAG_API uint32_t JexJtag_tap_shiftDeviceIR(unsigned handle, unsigned deviceIndex, unsigned shiftMode,
                                               unsigned exitState, void* callerData, unsigned bitCount,
                                               const unsigned char* tdibuf, unsigned char* tdobuf,
                                               const unsigned char* tdimask, const unsigned char* tdomask)
{
    return shiftThrough(Shift::DeviceIR, handle, deviceIndex, shiftMode, exitState, callerData, bitCount, tdibuf,
                        tdobuf, tdimask, tdomask);
}

JEXJTAG_API uint32_t JexJtag_tap_shiftChainDR(unsigned handle, unsigned shiftMode, unsigned exitState,
                                              void* callerData, unsigned bitCount, const unsigned char* tdibuf,
                                              unsigned char* tdobuf, const unsigned char* tdimask,
                                              const unsigned char* tdomask)
{
    return shiftThrough(Shift::ChainDR, handle, 0, shiftMode, exitState, callerData, bitCount, tdibuf, tdobuf, tdimask,
                        tdomask);
}

JEXJTAG_API uint32_t JexJtag_tap_shiftDeviceDR(unsigned handle, unsigned deviceIndex, unsigned shiftMode,
                                               unsigned exitState, void* callerData, unsigned bitCount,
                                               const unsigned char* tdibuf, unsigned char* tdobuf,
                                               const unsigned char* tdimask, const unsigned char* tdomask)
{
    return shiftThrough(Shift::DeviceDR, handle, deviceIndex, shiftMode, exitState, callerData, bitCount, tdibuf,
                        tdobuf, tdimask, tdomask);
}

} // extern "C"
