// SPDX-License-Identifier: MIT
#pragma once
// Each layer hands the next a pointer to its own copy of the call context.

#include "jexjtag/types.h"

namespace JexRT {

// A copy of *context (all zero for a null context).  Copied field by field:
// the caller has just written the fields one by one, and a single wide load
// of them would stall on every scan.
inline JexJtagCallContext copyCallContext(const JexJtagCallContext* context)
{
    JexJtagCallContext copy{};
    if (context) {
        copy.handle = context->handle;
        copy.reserved = context->reserved;
        copy.callerData = context->callerData;
    }
    return copy;
}

} // namespace JexRT
