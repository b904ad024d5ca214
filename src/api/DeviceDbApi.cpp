// SPDX-License-Identifier: MIT
// Exported device-database functions: a host's own IDCODE lists and device
// lookups by IDCODE text, and the JexRT functions behind them.

#include <algorithm>
#include <cstring>
#include <sstream>
#include <string>

#include "api/ApiGuard.hpp"
#include "api/IdcodeText.hpp"
#include "jexjtag/db.h"
#include "jexjtag/rt/Devices.hpp"
#include "jexjtag/rt/IDCode.hpp"
#include "session/Session.hpp"
#include "session/SessionRegistry.hpp"
#include "util/Logger.hpp"
#include "util/MethodLogger.hpp"

using namespace JexRT;

namespace {

constexpr unsigned kLocalNameSize = 128;
constexpr unsigned kLocalBypassSize = 33;

const char* shown(const char* text) { return text ? text : "NULL"; }

// Copies text into buf of size bytes: up to size bytes, NUL padding, and the
// last byte always NUL, so a longer text is cut to size - 1 characters.
void copyCut(char* buf, unsigned size, const std::string& text)
{
    const size_t n = std::min<size_t>(text.size(), size - 1);
    std::memcpy(buf, text.data(), n);
    std::memset(buf + n, 0, size - n);
}

unsigned lookup(unsigned handle, const IDCode& code, std::string& deviceName, unsigned* irLength,
                unsigned* familyType, unsigned* familySubType, std::string& bypass, bool* isUserList)
{
    Session* session = findSession(handle);
    if (!session) return JEX_FAILURE;
    return session->idcodeLookup(code, deviceName, irLength, familyType, familySubType, bypass, isUserList);
}

} // namespace

namespace JexRT {

unsigned addDeviceData(unsigned handle, const std::string& fileName, std::istream& data)
{
    return guardedCall("JexRT::addDeviceData", [&]() -> unsigned {
        Session* session = findSession(handle);
        if (!session) return JEX_FAILURE;
        return session->addDeviceData(fileName, data);
    });
}

unsigned idcodeLookup(unsigned handle, const std::string& idcode, std::string& deviceName, unsigned* irLength,
                      unsigned* familyType, unsigned* familySubType, std::string& bypass, bool* isUserList)
{
    return guardedCall("JexRT::idcodeLookup", [&]() -> unsigned {
        if (!isIdcodeText(idcode.c_str()) || idcode.size() != std::strlen(idcode.c_str())) return JEX_FAILURE;
        return lookup(handle, IDCode(idcode), deviceName, irLength, familyType, familySubType, bypass,
                      isUserList);
    });
}

unsigned idcodeLookup(unsigned handle, unsigned idcode, std::string& deviceName, unsigned* irLength,
                      unsigned* familyType, unsigned* familySubType, std::string& bypass, bool* isUserList)
{
    return guardedCall("JexRT::idcodeLookup", [&]() -> unsigned {
        return lookup(handle, IDCode(idcode), deviceName, irLength, familyType, familySubType, bypass,
                      isUserList);
    });
}

} // namespace JexRT

extern "C" {

JEXJTAG_API uint32_t JexJtag_db_addDeviceData(unsigned handle, const char* filename, const char* buf,
                                              unsigned bufsize)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_db_addDeviceData");
    Logger::logger.printLog(3, "JexJtag_db_addDeviceData() handle=%u, filename=%s, bufsize=%u\n", handle,
                            shown(filename), bufsize);
    const unsigned status = guardedCall("JexJtag_db_addDeviceData", [&]() -> unsigned {
        if (!filename || (!buf && bufsize != 0)) return JEX_FAILURE;
        // Exactly bufsize bytes, embedded NUL bytes included.
        std::stringstream data(std::string(buf ? buf : "", bufsize));
        return JexRT::addDeviceData(handle, filename, data);
    });
    return tracer.setReturnStatus(status);
}

JEXJTAG_API uint32_t JexJtag_db_lookupDevice(unsigned handle, const char* idcode, char* deviceName,
                                             unsigned devicebuf_size, unsigned* irlen, char* cmd_bypass,
                                             unsigned bypassbuf_size)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_db_lookupDevice");
    Logger::logger.printLog(3,
                            "JexJtag_db_lookupDevice() handle=%u, idcode=%s, devicebuf_size=%u, "
                            "bypassbuf_size=%u\n",
                            handle, shown(idcode), devicebuf_size, bypassbuf_size);
    // A given buffer needs room for at least its NUL.
    const bool buffersUsable = (!deviceName || devicebuf_size > 0) && (!cmd_bypass || bypassbuf_size > 0);
    std::string name;
    std::string bypass;
    unsigned length = 0;
    unsigned status = JEX_FAILURE;
    if (idcode && buffersUsable) {
        status = guardedCall("JexJtag_db_lookupDevice", [&]() -> unsigned {
            unsigned familyType = 0;
            unsigned familySubType = 0;
            bool isUserList = false;
            return JexRT::idcodeLookup(handle, std::string(idcode), name, &length, &familyType, &familySubType,
                                       bypass, &isUserList);
        });
    }

    if (JEX_FAILED(status)) {
        if (deviceName) std::memset(deviceName, 0, devicebuf_size);
        if (irlen) *irlen = 0;
        if (cmd_bypass) std::memset(cmd_bypass, 0xFF, bypassbuf_size);
        return tracer.setReturnStatus(status);
    }
    if (deviceName) copyCut(deviceName, devicebuf_size, name);
    if (irlen) *irlen = length;
    if (cmd_bypass) copyCut(cmd_bypass, bypassbuf_size, bypass);
    if (deviceName && irlen && cmd_bypass)
        Logger::logger.printLog(3, "JexJtag_db_lookupDevice() returning deviceName=%s, irlen=%u, cmd_bypass=%s\n",
                                deviceName, *irlen, cmd_bypass);
    return tracer.setReturnStatus(status);
}

JEXJTAG_API uint32_t JexJtag_db_getDeviceNameForIdcode(unsigned handle, const char* idcode, char* deviceName,
                                                       unsigned devicebuf_size)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_db_getDeviceNameForIdcode");
    Logger::logger.printLog(3, "JexJtag_db_getDeviceNameForIdcode() handle=%u, idcode=%s, devicebuf_size=%u\n",
                            handle, shown(idcode), devicebuf_size);
    unsigned irlen = 0;
    char bypass[kLocalBypassSize];
    const unsigned status =
        JexJtag_db_lookupDevice(handle, idcode, deviceName, devicebuf_size, &irlen, bypass, sizeof bypass);
    if (!JEX_FAILED(status) && deviceName)
        Logger::logger.printLog(3, "JexJtag_db_getDeviceNameForIdcode() returning deviceName=%s\n", deviceName);
    return tracer.setReturnStatus(status);
}

JEXJTAG_API uint32_t JexJtag_db_getIRLengthForIdcode(unsigned handle, const char* idcode, unsigned* irlen)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_db_getIRLengthForIdcode");
    Logger::logger.printLog(3, "JexJtag_db_getIRLengthForIdcode() handle=%u, idcode=%s\n", handle, shown(idcode));
    char name[kLocalNameSize];
    char bypass[kLocalBypassSize];
    const unsigned status =
        JexJtag_db_lookupDevice(handle, idcode, name, sizeof name, irlen, bypass, sizeof bypass);
    if (!JEX_FAILED(status) && irlen)
        Logger::logger.printLog(3, "JexJtag_db_getIRLengthForIdcode() returning irlen=%u\n", *irlen);
    return tracer.setReturnStatus(status);
}

JEXJTAG_API uint32_t JexJtag_db_getBypassForIdcode(unsigned handle, const char* idcode, char* cmd_bypass,
                                                   unsigned bypassbuf_size)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_db_getBypassForIdcode");
    Logger::logger.printLog(3, "JexJtag_db_getBypassForIdcode() handle=%u, idcode=%s, bypassbuf_size=%u\n",
                            handle, shown(idcode), bypassbuf_size);
    char name[kLocalNameSize];
    unsigned irlen = 0;
    const unsigned status =
        JexJtag_db_lookupDevice(handle, idcode, name, sizeof name, &irlen, cmd_bypass, bypassbuf_size);
    if (!JEX_FAILED(status) && cmd_bypass)
        Logger::logger.printLog(3, "JexJtag_db_getBypassForIdcode() returning cmd_bypass=%s\n", cmd_bypass);
    return tracer.setReturnStatus(status);
}

} // extern "C"
