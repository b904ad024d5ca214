// SPDX-License-Identifier: MIT
#include "jexjtag/rt/JexJtagTargetLock.hpp"

#include "jexjtag/target.h"

namespace JexRT {

JexJtagTargetLock::JexJtagTargetLock(unsigned handle, unsigned msWait) : m_locked(false), m_handle(handle)
{
    unsigned status = 0;
    if (JEX_FAILED(JexJtag_target_getLockStatus(handle, &status))) throw Jex_AbortException();
    // Held already (by an enclosing lock object, say): not ours to release.
    if (status == JEXJTAG_LOCKED_ME) return;
    JexJtag_target_lock(handle, msWait, &status);
    m_locked = (status == JEXJTAG_LOCKED_ME);
}

JexJtagTargetLock::~JexJtagTargetLock()
{
    if (m_locked) JexJtag_target_unlock(m_handle);
}

} // namespace JexRT
