// SPDX-License-Identifier: MIT
// Exported BSDL import: the device name, IR length, IDCODE text and BYPASS
// opcode of a BSDL file or of a BSDL text in memory.

#include <climits>
#include <cstdio>
#include <cstring>
#include <memory>
#include <new>
#include <string>

#include "api/ApiGuard.hpp"
#include "jexjtag/db.h"
#include "session/Session.hpp"
#include "session/SessionRegistry.hpp"
#include "util/Jex_Util.hpp"
#include "util/Logger.hpp"
#include "util/MethodLogger.hpp"

using namespace JexRT;

namespace {

void zero(char* buf, unsigned size)
{
    if (buf) std::memset(buf, 0, size);
}

// Copies text into a given buffer: at most size bytes, NUL-padded, the last
// byte always NUL, so a longer text is cut to size - 1 characters.
void copyCut(char* buf, unsigned size, const std::string& text)
{
    if (!buf || size == 0) return;
    std::strncpy(buf, text.c_str(), size);
    buf[size - 1] = '\0';
}

const char* shown(const char* text) { return text ? text : "NULL"; }

} // namespace

extern "C" {

JEXJTAG_API uint32_t JexJtag_db_parseBSDL(unsigned handle, const char* filename, const char* buf, unsigned bufLen,
                                          char* deviceName, unsigned deviceNameLen, unsigned* irlength, char* idcode,
                                          unsigned idcodeLen, char* cmd_bypass, unsigned bypassbufLen)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_db_parseBSDL");
    Logger::logger.printLog(3,
                            "JexJtag_db_parseBSDL() handle=%u, filename=%s, bufLen=%u, deviceNameLen=%u, "
                            "idcodeLen=%u, bypassbufLen=%u\n",
                            handle, shown(filename), bufLen, deviceNameLen, idcodeLen, bypassbufLen);
    zero(deviceName, deviceNameLen);
    zero(idcode, idcodeLen);
    zero(cmd_bypass, bypassbufLen);
    if (irlength) *irlength = 0;

    const unsigned status = guardedCall("JexJtag_db_parseBSDL", [&]() -> unsigned {
        Session* session = findSession(handle);
        if (!session) return JEX_FAILURE;
        if (!buf && bufLen > 0) return JEX_FAILURE;
        std::string name, code, bypass;
        unsigned length = 0;
        const unsigned result = session->parseBSDLFromBuffer(Jex_Util::trimWhitespace(filename ? filename : ""),
                                                             buf, bufLen, name, &length, code, bypass);
        if (JEX_FAILED(result)) return result;
        copyCut(deviceName, deviceNameLen, name);
        if (irlength) *irlength = length;
        copyCut(idcode, idcodeLen, code);
        copyCut(cmd_bypass, bypassbufLen, bypass);
        if (deviceName && idcode && cmd_bypass)
            Logger::logger.printLog(3,
                                    "JexJtag_db_parseBSDL() returning deviceName=%s, irlength=%u, idcode=%s, "
                                    "cmd_bypass=%s\n",
                                    deviceName, length, idcode, cmd_bypass);
        return result;
    });
    return tracer.setReturnStatus(status);
}

JEXJTAG_API uint32_t JexJtag_db_parseBSDLFile(unsigned handle, const char* filename, char* deviceName,
                                              unsigned deviceNameLen, unsigned* irlength, char* idcode,
                                              unsigned idcodeLen, char* cmd_bypass, unsigned bypassbufLen)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_db_parseBSDLFile");
    Logger::logger.printLog(3,
                            "JexJtag_db_parseBSDLFile() handle=%u, filename=%s, deviceNameLen=%u, idcodeLen=%u, "
                            "bypassbufLen=%u\n",
                            handle, shown(filename), deviceNameLen, idcodeLen, bypassbufLen);
    const unsigned status = guardedCall("JexJtag_db_parseBSDLFile", [&]() -> unsigned {
        if (!filename) return JEX_FAILURE;
        Session* session = findSession(handle);
        if (!session) // clears the outputs, as for a text
            return JexJtag_db_parseBSDL(handle, filename, nullptr, 0, deviceName, deviceNameLen, irlength, idcode,
                                        idcodeLen, cmd_bypass, bypassbufLen);
        const std::string path = Jex_Util::trimWhitespace(filename);
        // Read once, within the size limit, before anything is copied.
        std::string data;
        if (JEX_FAILED(session->readBSDLFile(path, data))) return JEX_FAILURE;
        const unsigned result = JexJtag_db_parseBSDL(handle, path.c_str(), data.data(),
                                                     static_cast<unsigned>(data.size()), deviceName, deviceNameLen,
                                                     irlength, idcode, idcodeLen, cmd_bypass, bypassbufLen);
        std::string().swap(data);
        if (!JEX_FAILED(result) && deviceName && irlength && idcode && cmd_bypass)
            Logger::logger.printLog(3,
                                    "JexJtag_db_parseBSDLFile() returning deviceName=%s, irlength=%u, idcode=%s, "
                                    "cmd_bypass=%s\n",
                                    deviceName, *irlength, idcode, cmd_bypass);
        return result;
    });
    return tracer.setReturnStatus(status);
}

} // extern "C"
