// SPDX-License-Identifier: MIT
#pragma once
// Jex_AbortException - thrown by JexJtagTargetLock when its handle reaches
// no target; its message is "Jex abort command".

#include <stdexcept>

#include "../export.h"

namespace JexRT {

class JEXJTAG_API Jex_AbortException : public std::logic_error {
public:
    Jex_AbortException();
    ~Jex_AbortException() override;
    Jex_AbortException(const Jex_AbortException&) = default;
    Jex_AbortException& operator=(const Jex_AbortException&) = default;
};

} // namespace JexRT
