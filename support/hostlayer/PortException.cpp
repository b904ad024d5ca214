// SPDX-License-Identifier: MIT
#include "hostlayer/PortException.hpp"

#include <utility>

namespace Port {

Exception::Exception(std::wstring message) : m_message(std::move(message)) {}
Exception::~Exception() = default;

} // namespace Port
