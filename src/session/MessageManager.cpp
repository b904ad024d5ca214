// SPDX-License-Identifier: MIT
#include "session/MessageManager.hpp"

#include <algorithm>

#include "session/MessageListener.hpp"
#include "session/PortabilityMessageInterceptor.hpp"

namespace JexRT {

MessageManager& MessageManager::getInstance()
{
    // Never destroyed: a host may destroy its sessions from an atexit
    // handler or a global destructor, after the library's statics are gone.
    static MessageManager* const instance = new MessageManager();
    return *instance;
}

MessageManager::MessageManager() : m_interceptor(std::make_unique<PortabilityMessageInterceptor>()) {}

MessageManager::~MessageManager() = default;

void MessageManager::addListener(MessageListener* listener)
{
    std::lock_guard<std::recursive_mutex> lock(m_mutex);
    m_listeners.push_back(listener);
}

void MessageManager::removeListener(MessageListener* listener)
{
    std::lock_guard<std::recursive_mutex> lock(m_mutex);
    auto it = std::find(m_listeners.begin(), m_listeners.end(), listener);
    if (it != m_listeners.end()) m_listeners.erase(it);
}

void MessageManager::broadcast(const Message& message)
{
    // Held throughout: a listener of another thread's session is not
    // removed while it is being called.  Copy: a host callback may create or
    // destroy sessions while it runs.
    std::lock_guard<std::recursive_mutex> lock(m_mutex);
    const std::vector<MessageListener*> listeners = m_listeners;
    for (MessageListener* listener : listeners) {
        if (std::find(m_listeners.begin(), m_listeners.end(), listener) == m_listeners.end()) continue;
        listener->onMessage(message);
    }
}

} // namespace JexRT
