#include "session/MessageManager.hpp"

#include <algorithm>

#include "session/MessageListener.hpp"
#include "session/PortabilityMessageInterceptor.hpp"

namespace JexRT {

MessageManager& MessageManager::getInstance()
{
    // Lives until the library is unloaded; its destruction uninstalls the
    // interceptor and gives the dispatcher its previous default manager back.
    // The dispatcher is set up inside the constructor, so it outlives this.
    static const std::unique_ptr<MessageManager> instance(new MessageManager());
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
