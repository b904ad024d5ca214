// SPDX-License-Identifier: MIT
#pragma once
// The boundary of every exported function: no exception leaves the library.
// An exception that reaches it is logged at level 1 and becomes JEX_FAILURE.
// The body runs inside an ApiCallScope: teardown that a callback asks for
// during the call completes when the outermost call returns.

#include <exception>
#include <new>

#include "jexjtag/rt/Jex_Exception.hpp"
#include "jexjtag/types.h"
#include "session/ApiCallScope.hpp"
#include "util/Logger.hpp"

namespace JexRT {

template <typename Body>
unsigned guardedCall(const char* function, Body&& body) noexcept
{
    ApiCallScope scope;
    try {
        return body();
    } catch (const Jex_Exception& e) {
        Logger::logger.printLog(1, "%s() - %s\n", function, e.getMessage().c_str());
    } catch (const std::bad_alloc&) {
        Logger::logger.printLog(1, "%s() - out of memory\n", function);
    } catch (const std::exception& e) {
        Logger::logger.printLog(1, "%s() - %s\n", function, e.what());
    } catch (...) {
        Logger::logger.printLog(1, "%s() - unexpected exception\n", function);
    }
    return JEX_FAILURE;
}

} // namespace JexRT
