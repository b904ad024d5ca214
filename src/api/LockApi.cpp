// SPDX-License-Identifier: MIT
// Exported lock functions: take, release and query the cross-process
// target lock, and clean stale locks of the USB cable type.

#include "api/ApiGuard.hpp"
#include "jexjtag/target.h"
#include "session/Session.hpp"
#include "session/SessionRegistry.hpp"
#include "target/Target.hpp"
#include "util/Logger.hpp"
#include "util/MethodLogger.hpp"

using namespace JexRT;

namespace {

// The target type whose stale locks cleanLocks removes.
const char* const kUsbCableType = "ormund_usbcable";

const char* lockStatusName(unsigned status)
{
    switch (status) {
    case JEXJTAG_NOTARGET: return "JEXJTAG_NOTARGET";
    case JEXJTAG_LOCKED_OTHER: return "JEXJTAG_LOCKED_OTHER";
    case JEXJTAG_LOCKED_ME: return "JEXJTAG_LOCKED_ME";
    case JEXJTAG_UNLOCKED: return "JEXJTAG_UNLOCKED";
    default: return "JEXJTAG_UNKNOWN";
    }
}

} // namespace

extern "C" {

JEXJTAG_API uint32_t JexJtag_target_lock(unsigned handle, unsigned msWait, unsigned* status)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_target_lock");
    Logger::logger.printLog(3, "JexJtag_target_lock() handle=%u, msWait=%i\n", handle, static_cast<int>(msWait));
    const unsigned result = guardedCall("JexJtag_target_lock", [&]() -> unsigned {
        if (!status) return JEX_FAILURE;
        unsigned locked = JEX_FAILURE;
        if (Target* target = findTarget(handle)) {
            locked = target->lock(msWait);
            *status = target->getLockStatus();
        }
        Logger::logger.printLog(3, "JexJtag_target_lock() returning status=%s\n", lockStatusName(*status));
        return locked;
    });
    return tracer.setReturnStatus(result);
}

JEXJTAG_API uint32_t JexJtag_target_unlock(unsigned handle)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_target_unlock");
    Logger::logger.printLog(3, "JexJtag_target_unlock() handle=%u\n", handle);
    const unsigned result = guardedCall("JexJtag_target_unlock", [&]() -> unsigned {
        Target* target = findTarget(handle);
        return target ? target->unlock() : JEX_FAILURE;
    });
    return tracer.setReturnStatus(result);
}

JEXJTAG_API uint32_t JexJtag_target_getLockStatus(unsigned handle, unsigned* status)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_target_getLockStatus");
    Logger::logger.printLog(3, "JexJtag_target_getLockStatus() handle=%u\n", handle);
    const unsigned result = guardedCall("JexJtag_target_getLockStatus", [&]() -> unsigned {
        if (!status) return JEX_FAILURE;
        unsigned found = JEX_FAILURE;
        if (Target* target = findTarget(handle)) {
            *status = target->getLockStatus();
            found = JEX_SUCCESS;
        }
        Logger::logger.printLog(3, "JexJtag_target_getLockStatus() returning status=%s\n", lockStatusName(*status));
        return found;
    });
    return tracer.setReturnStatus(result);
}

JEXJTAG_API uint32_t JexJtag_target_cleanLocks(unsigned handle)
{
    Logger::logger.startLogging();
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_target_cleanLocks");
    Logger::logger.printLog(3, "JexJtag_target_cleanLocks() handle=%u\n", handle);
    const unsigned result = guardedCall("JexJtag_target_cleanLocks", [&]() -> unsigned {
        // Only index 0 holds a target: any other low byte reaches none.
        Session* session = findSession(handle);
        const unsigned index = handle & JEX_HANDLE_TARGET_MASK;
        if (!session || index != 0) return JEX_FAILURE;
        if (session->getTarget(index)) {
            session->sendMessage(JEX_MSG_ERROR, "The locks cannot be cleaned while a target is Open.");
            return JEX_FAILURE;
        }
        Target* target = session->createTarget(index);
        if (!target) return JEX_FAILURE;
        unsigned cleaned = JEX_FAILURE;
        try {
            cleaned = target->cleanLocks(kUsbCableType);
        } catch (...) {
            session->destroyTarget(index);
            throw;
        }
        session->destroyTarget(index);
        return cleaned;
    });
    return tracer.setReturnStatus(result);
}

} // extern "C"
