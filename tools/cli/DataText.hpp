// SPDX-License-Identifier: MIT
#pragma once
// Register data as written on the command line, and TDO written back in the
// same notation.
//
// Data is a number written most significant bit first; its least significant
// bit (the last character) is shifted first:
//   0x1F     hexadecimal, 4 bits per digit written (leading zeros count)
//   0b0101   binary, 1 bit per digit
//   0101     binary without prefix (only 0 and 1)
// '_' may separate digits.  An explicit bit count widens the number with
// zeros or narrows it by dropping leading zeros; dropping a 1 is an error.

#include <optional>
#include <string>

#include "BitVector.hpp"

namespace jexjtag::cli {

enum class DataNotation { Hex, Binary, PrefixedBinary };

struct DataValue {
    BitVector bits;
    DataNotation notation = DataNotation::Hex;
};

// Longest shift the program accepts, in bits.
constexpr unsigned kMaxDataBits = 1u << 20;

// Reads text; bitCount, when given, fixes the length.  Throws UsageError.
DataValue parseData(const std::string& text, std::optional<unsigned> bitCount);

// bits in the notation: "0x..." for Hex, "0b..." for PrefixedBinary, plain
// 0/1 digits for Binary.
std::string formatData(const BitVector& bits, DataNotation notation);

} // namespace jexjtag::cli
