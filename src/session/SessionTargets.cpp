// SPDX-License-Identifier: MIT
// The session's target slot: at most one Target, at index 0.

#include <new>

#include "session/ApiCallScope.hpp"
#include "session/Session.hpp"
#include "target/Target.hpp"

namespace JexRT {

Target* Session::getTarget(unsigned index) const { return index == 0 ? m_target : nullptr; }

Target* Session::createTarget(unsigned index)
{
    if (index != 0) return nullptr;
    destroyTarget(0);
    try {
        m_target = new Target(this);
    } catch (const std::bad_alloc&) {
        m_target = nullptr;
    }
    return m_target;
}

void Session::destroyTarget(unsigned index)
{
    if (index != 0 || !m_target) return;
    Target* target = m_target;
    m_target = nullptr;
    if (ApiCallScope::nested()) ApiCallScope::defer([target] { delete target; });
    else delete target;
}

} // namespace JexRT
