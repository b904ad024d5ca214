// SPDX-License-Identifier: MIT
#pragma once
// Jex_Exception - the exception the library's classes throw.  The exported
// C functions never let it (or any other exception) escape; hosts that use
// the JexRT classes directly may catch it.

#include <string>

#include "../export.h"

class JEXJTAG_API Jex_Exception {
public:
    explicit Jex_Exception(std::string message) : m_message(std::move(message)) {}
    virtual ~Jex_Exception();
    Jex_Exception(const Jex_Exception&) = default;
    Jex_Exception& operator=(const Jex_Exception&) = default;

    // The message text.
    const std::string& getMessage() const { return m_message; }
    const char* what() const noexcept { return m_message.c_str(); }

private:
    std::string m_message;
};
