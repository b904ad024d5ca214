// SPDX-License-Identifier: MIT
#pragma once
// A session's entry in the MessageManager: hands every broadcast message to
// its session's sendMessage.

#include "session/MessageListener.hpp"

namespace JexRT {

class Session;

class InternalSessionMessageListener : public MessageListener {
public:
    explicit InternalSessionMessageListener(Session* session) : m_session(session) {}
    ~InternalSessionMessageListener() override;
    void onMessage(const Message& message) override;

private:
    Session* m_session;
};

} // namespace JexRT
