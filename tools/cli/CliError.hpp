// SPDX-License-Identifier: MIT
#pragma once
// An operation that failed (the library refused, a file is missing, ...):
// exit status 1.

#include <stdexcept>
#include <string>

namespace jexjtag::cli {

class CliError : public std::runtime_error {
public:
    explicit CliError(const std::string& message) : std::runtime_error(message) {}
};

} // namespace jexjtag::cli
