// SPDX-License-Identifier: MIT
#pragma once
// Strict reading of unsigned decimal numbers from the command line.

#include <optional>
#include <string>

namespace jexjtag::cli {

// The value of text when it is a plain decimal number (digits only, no sign,
// no blanks) that fits into 32 bits and is at most `maximum`; otherwise none.
std::optional<unsigned> parseUnsigned(const std::string& text, unsigned maximum = 0xFFFFFFFFu);

} // namespace jexjtag::cli
