// SPDX-License-Identifier: MIT
#pragma once
// The session registry: owns the live sessions, hands out their handles and
// resolves a handle to its session or target in constant time.

#include "jexjtag/rt/Sessions.hpp"

namespace JexRT {

class Session;
class Target;

// The live session whose id is handle & 0x00FF0000, or null.
Session* findSession(unsigned handle);
// That session's target at index handle & 0xFF, or null.
Target* findTarget(unsigned handle);
// True while no session is live.
bool noLiveSessions();

} // namespace JexRT
