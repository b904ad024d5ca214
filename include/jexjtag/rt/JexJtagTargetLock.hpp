// SPDX-License-Identifier: MIT
#pragma once
// JexJtagTargetLock - holds the cross-process lock of a target for the
// lifetime of the object.
//
//     {
//         JexRT::JexJtagTargetLock lock(handle, JexRT::JexJtagTargetLock::ONE_MINUTE_MAX_WAIT);
//         ... shifts ...
//     } // unlocked here, if this object took the lock
//
// The constructor throws Jex_AbortException when the handle reaches no
// target.  When this process already holds the lock (an enclosing lock
// object, or JexJtag_target_lock), the object takes nothing and releases
// nothing, so lock objects nest.  When the plug-in does not grant the lock
// within msWait, nothing is thrown: the object simply holds no lock
// (see holdsLock()).

#include "../types.h"
#include "Jex_AbortException.hpp"

namespace JexRT {

class JEXJTAG_API JexJtagTargetLock {
public:
    // One minute in milliseconds, for msWait.
    static constexpr unsigned ONE_MINUTE_MAX_WAIT = 60000;

    JexJtagTargetLock(unsigned handle, unsigned msWait);
    // Unlocks when this object took the lock.
    ~JexJtagTargetLock();
    // Not copyable: only the object that took the lock releases it.
    JexJtagTargetLock(const JexJtagTargetLock&) = delete;
    JexJtagTargetLock& operator=(const JexJtagTargetLock&) = delete;

    // True when this object took the lock and will release it.
    bool holdsLock() const { return m_locked; }
    unsigned getHandle() const { return m_handle; }

private:
    bool m_locked = false;
    unsigned m_handle = 0;
};

} // namespace JexRT
