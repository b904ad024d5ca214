#include "session/MessageManager.hpp"

#include <algorithm>

#include "session/MessageListener.hpp"
#include "session/PortabilityMessageInterceptor.hpp"

namespace JexRT {

MessageManager& MessageManager::getInstance()
{
    // Never destroyed: the interceptor stays installed while the library is
    // loaded, and messages raised during static destruction find a manager.
    static MessageManager* instance = new MessageManager();
    return *instance;
}

MessageManager::MessageManager() : m_interceptor(std::make_unique<PortabilityMessageInterceptor>()) {}

MessageManager::~MessageManager() = default;

void MessageManager::addListener(MessageListener* listener) { m_listeners.push_back(listener); }

void MessageManager::removeListener(MessageListener* listener)
{
    auto it = std::find(m_listeners.begin(), m_listeners.end(), listener);
    if (it != m_listeners.end()) m_listeners.erase(it);
}

void MessageManager::broadcast(const Message& message)
{
    // Copy: a host callback may create or destroy sessions while it runs.
    const std::vector<MessageListener*> listeners = m_listeners;
    for (MessageListener* listener : listeners) {
        if (std::find(m_listeners.begin(), m_listeners.end(), listener) == m_listeners.end()) continue;
        listener->onMessage(message);
    }
}

} // namespace JexRT
