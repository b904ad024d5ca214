// SPDX-License-Identifier: MIT
#pragma once
// A command line that cannot be carried out as written: exit status 2.

#include <stdexcept>
#include <string>

namespace jexjtag::cli {

class UsageError : public std::runtime_error {
public:
    explicit UsageError(const std::string& message) : std::runtime_error(message) {}
};

} // namespace jexjtag::cli
