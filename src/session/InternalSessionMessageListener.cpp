// SPDX-License-Identifier: MIT
#include "session/InternalSessionMessageListener.hpp"

#include <string>

#include "session/Message.hpp"
#include "session/Session.hpp"

namespace JexRT {

InternalSessionMessageListener::~InternalSessionMessageListener() { m_session = nullptr; }

void InternalSessionMessageListener::onMessage(const Message& message)
{
    if (!m_session) return;
    unsigned type = 0;
    std::string text;
    message.getMessage(type, text);
    m_session->sendMessage(type, text);
}

} // namespace JexRT
