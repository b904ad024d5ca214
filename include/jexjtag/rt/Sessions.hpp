// SPDX-License-Identifier: MIT
#pragma once
// Session functions of the JexRT class interface, for hosts that link
// against libJexJtag as a class library.  Each returns JEX_SUCCESS or
// JEX_FAILURE.

#include <string>
#include <vector>

#include "../types.h"
#include "SessionMessageListener.hpp"

namespace JexRT {

// Creates and registers a session; writes its handle (0 on failure).
JEXJTAG_API unsigned createSession(JexMessageCallback msgCallback, unsigned argc, const char** argv,
                                   unsigned* handle);
// Destroys the session of handle.
JEXJTAG_API unsigned destroySession(unsigned handle);
// Appends a listener; JEX_FAILURE when it is registered already.
JEXJTAG_API unsigned addSessionMessageListener(SessionMessageListener* listener);
// Removes a listener; JEX_FAILURE when it is not registered.
JEXJTAG_API unsigned removeSessionMessageListener(SessionMessageListener* listener);
// Copies argc texts of argv, in order (null entries become empty texts).
JEXJTAG_API std::vector<std::string> getArgs(unsigned argc, const char** argv);

} // namespace JexRT
