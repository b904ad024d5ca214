// SPDX-License-Identifier: MIT
#pragma once
// SessionMessageListener - implemented by a host to hear of sessions being
// created and destroyed (register with JexRT::addSessionMessageListener).

namespace JexRT {

class SessionMessageListener {
public:
    virtual ~SessionMessageListener() = default;
    // After a session was created and registered, with its handle.
    virtual void sessionCreated(unsigned handle) = 0;
    // After a session was destroyed, with the handle as the caller passed it.
    virtual void sessionDestroyed(unsigned handle) = 0;
};

} // namespace JexRT
