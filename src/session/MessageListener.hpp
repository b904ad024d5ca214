// SPDX-License-Identifier: MIT
#pragma once
// Receiver of the messages the MessageManager broadcasts.

namespace JexRT {

class Message;

class MessageListener {
public:
    virtual ~MessageListener() = default;
    virtual void onMessage(const Message& message) = 0;
};

} // namespace JexRT
