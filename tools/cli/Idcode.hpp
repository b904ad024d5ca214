// SPDX-License-Identifier: MIT
#pragma once
// IDCODEs on the command line and in output: 0x0362D093 for people, 32
// binary digits (most significant first) for the library.

#include <cstdint>
#include <optional>
#include <string>

namespace jexjtag::cli {

// "0x..." hexadecimal, or binary digits ("0b..." or plain 0/1, at most 32
// significant; shorter means leading zeros).  Throws UsageError.
uint32_t parseIdcode(const std::string& text);

// "0x%08X".
std::string idcodeHex(uint32_t idcode);
// 32 characters '0'/'1', most significant bit first.
std::string idcodeBits(uint32_t idcode);
// The value of a library IDCODE text (1 to 32 characters '0'/'1'); none for
// anything else, for example a text with don't-care bits.
std::optional<uint32_t> idcodeFromBits(const std::string& bits);

} // namespace jexjtag::cli
