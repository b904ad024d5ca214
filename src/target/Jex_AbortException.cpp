// SPDX-License-Identifier: MIT
#include "jexjtag/rt/Jex_AbortException.hpp"

namespace JexRT {

Jex_AbortException::Jex_AbortException() : std::logic_error("Jex abort command") {}

Jex_AbortException::~Jex_AbortException() = default;

} // namespace JexRT
