// SPDX-License-Identifier: MIT
#include "session/Message.hpp"

#include <utility>

namespace JexRT {

Message::Message(unsigned type, std::string text) : m_text(std::move(text)), m_type(type) {}

Message::~Message() = default;

void Message::setMessage(unsigned type, std::string text)
{
    m_type = type;
    m_text = std::move(text);
}

void Message::getMessage(unsigned& type, std::string& text) const
{
    type = m_type;
    text = m_text;
}

} // namespace JexRT
