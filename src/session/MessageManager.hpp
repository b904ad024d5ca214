// SPDX-License-Identifier: MIT
#pragma once
// The process-wide message manager: the listeners of all live sessions, and
// the interceptor that brings the host layer's messages to them.  Created on
// first use and kept until the library is unloaded.

#include <memory>
#include <mutex>
#include <vector>

namespace JexRT {

class Message;
class MessageListener;
class PortabilityMessageInterceptor;

class MessageManager {
public:
    // The instance; constructing it installs the interceptor.
    static MessageManager& getInstance();

    virtual ~MessageManager();
    MessageManager(const MessageManager&) = delete;
    MessageManager& operator=(const MessageManager&) = delete;

    // Appends (duplicates allowed).
    void addListener(MessageListener* listener);
    // Removes the first occurrence; nothing when absent.
    void removeListener(MessageListener* listener);
    // Calls onMessage on every listener, in registration order.
    void broadcast(const Message& message);

private:
    MessageManager();

    std::recursive_mutex m_mutex;
    std::vector<MessageListener*> m_listeners;
    std::unique_ptr<PortabilityMessageInterceptor> m_interceptor;
};

} // namespace JexRT
