// SPDX-License-Identifier: MIT
#include "DataText.hpp"

#include <vector>

#include "UsageError.hpp"

namespace jexjtag::cli {

namespace {

int hexDigitValue(char c)
{
    if (c >= '0' && c <= '9') return c - '0';
    if (c >= 'a' && c <= 'f') return c - 'a' + 10;
    if (c >= 'A' && c <= 'F') return c - 'A' + 10;
    return -1;
}

bool hasPrefix(const std::string& text, char letter)
{
    return text.size() >= 2 && text[0] == '0' && (text[1] == letter || text[1] == (letter - 'a' + 'A'));
}

// The digit values of text (least significant last), '_' skipped.
std::vector<int> digitsOf(const std::string& original, const std::string& digits, bool hex)
{
    std::vector<int> values;
    for (const char c : digits) {
        if (c == '_') continue;
        const int v = hex ? hexDigitValue(c) : (c == '0' ? 0 : c == '1' ? 1 : -1);
        if (v < 0) {
            if (hex) throw UsageError("'" + original + "' is not valid hexadecimal data");
            throw UsageError("'" + original + "' is not valid data: write hex as 0x..., bits as 0b... or 0/1 digits");
        }
        values.push_back(v);
    }
    if (values.empty()) throw UsageError("'" + original + "' holds no digits");
    return values;
}

} // namespace

DataValue parseData(const std::string& text, std::optional<unsigned> bitCount)
{
    DataValue value;
    std::string digits = text;
    unsigned bitsPerDigit = 1;
    if (hasPrefix(text, 'x')) {
        value.notation = DataNotation::Hex;
        digits = text.substr(2);
        bitsPerDigit = 4;
    } else if (hasPrefix(text, 'b')) {
        value.notation = DataNotation::PrefixedBinary;
        digits = text.substr(2);
    } else {
        value.notation = DataNotation::Binary;
    }
    const std::vector<int> values = digitsOf(text, digits, bitsPerDigit == 4);
    if (values.size() > kMaxDataBits / bitsPerDigit)
        throw UsageError("data '" + text.substr(0, 16) + "...' is longer than " + std::to_string(kMaxDataBits) +
                         " bits");
    const unsigned written = static_cast<unsigned>(values.size()) * bitsPerDigit;

    if (bitCount && *bitCount == 0) throw UsageError("--bits must be at least 1");
    if (bitCount && *bitCount > kMaxDataBits)
        throw UsageError("--bits " + std::to_string(*bitCount) + " is more than " + std::to_string(kMaxDataBits));

    BitVector all(written);
    for (size_t d = 0; d < values.size(); ++d) {
        const unsigned lowBit = static_cast<unsigned>(values.size() - 1 - d) * bitsPerDigit;
        for (unsigned b = 0; b < bitsPerDigit; ++b) all.set(lowBit + b, ((values[d] >> b) & 1) != 0);
    }
    const unsigned length = bitCount ? *bitCount : written;
    for (unsigned i = length; i < written; ++i)
        if (all.get(i))
            throw UsageError("data '" + text + "' does not fit into " + std::to_string(length) + " bits");
    value.bits = BitVector(length);
    for (unsigned i = 0; i < length && i < written; ++i) value.bits.set(i, all.get(i));
    return value;
}

std::string formatData(const BitVector& bits, DataNotation notation)
{
    switch (notation) {
    case DataNotation::Hex:
        return bits.toHex();
    case DataNotation::PrefixedBinary:
        return "0b" + bits.toBinary();
    case DataNotation::Binary:
        break;
    }
    return bits.toBinary();
}

} // namespace jexjtag::cli
