// SPDX-License-Identifier: MIT
#pragma once
// The table of host functions handed to every plug-in module through
// JexPlugin_setCallbacks: messages to a session's host, and the library's log.

#include "jexjtag/plugin.h"

namespace JexRT {

// A filled table.  Each function stops every exception before it returns
// into the plug-in.
JexPluginCallbacks makePluginHostCallbacks();

} // namespace JexRT
