// SPDX-License-Identifier: MIT
#pragma once
// Names of the sixteen TAP controller states, as the program accepts and
// prints them.

#include <string>

namespace jexjtag::cli {

// The state for a name: the canonical name ("RUN_TEST_IDLE"), the same with
// the prefix "JEXJTAG_", any of these in lower case or with '-' for '_'
// ("pause-dr"), the short names idle, rti, reset and tlr, or the number
// 0..15.  Throws UsageError for anything else.
unsigned parseTapState(const std::string& name);

// "RUN_TEST_IDLE" and so on; "STATE_<n>" outside 0..15.
std::string tapStateName(unsigned state);

// The accepted names, for help texts: "TEST_LOGIC_RESET, RUN_TEST_IDLE, ...".
std::string tapStateNameList();

} // namespace jexjtag::cli
