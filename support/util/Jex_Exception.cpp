// SPDX-License-Identifier: MIT
#include "jexjtag/rt/Jex_Exception.hpp"

Jex_Exception::~Jex_Exception() = default;
