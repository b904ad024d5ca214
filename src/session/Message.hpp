// SPDX-License-Identifier: MIT
#pragma once
// One message of the library-wide message path: a type and a text.

#include <string>

namespace JexRT {

class Message {
public:
    Message() = default;
    Message(unsigned type, std::string text);
    virtual ~Message();

    void setMessage(unsigned type, std::string text);
    void getMessage(unsigned& type, std::string& text) const;

private:
    std::string m_text;
    unsigned m_type = 0;
};

} // namespace JexRT
