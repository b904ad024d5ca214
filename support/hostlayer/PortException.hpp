// SPDX-License-Identifier: MIT
#pragma once
// The exception class of the host layer and the libraries built on it: it
// carries a wide-character message.

#include <string>

namespace Port {

class Exception {
public:
    explicit Exception(std::wstring message);
    virtual ~Exception();
    const std::wstring& getMessage() const { return m_message; }

private:
    std::wstring m_message;
};

} // namespace Port
