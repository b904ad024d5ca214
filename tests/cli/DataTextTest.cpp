// SPDX-License-Identifier: MIT
// Bit buffers, the data notation of shift and the IDCODE notation.

#include <gtest/gtest.h>

#include <optional>
#include <string>
#include <utility>

#include "BitVector.hpp"
#include "DataText.hpp"
#include "Idcode.hpp"
#include "UsageError.hpp"

using namespace jexjtag::cli;

namespace {

BitVector bitsOf(const std::string& text, std::optional<unsigned> count = std::nullopt)
{
    return parseData(text, count).bits;
}

} // namespace

TEST(DataTextTest, LengthFollowsTheDigitsWrittenOrBits)
{
    // Leading zeros count; --bits widens with zeros or drops leading zeros, never a 1.
    const struct {
        const char* text;
        std::optional<unsigned> bits;
        const char* binary;
    } cases[] = {{"0x01F", {}, "000000011111"}, {"0x4BA0_0477", {}, "01001011101000000000010001110111"},
                 {"1_0000_0000", {}, "100000000"}, {"0x1", 10u, "0000000001"}, {"0x09", 6u, "001001"},
                 {"0b00011", 5u, "00011"}, {"0b00011", 2u, "11"}};
    for (const auto& c : cases) EXPECT_EQ(c.binary, bitsOf(c.text, c.bits).toBinary()) << c.text;
    EXPECT_EQ((std::vector<uint8_t>{0x77, 0x04, 0xA0, 0x4B}), bitsOf("0x4ba0_0477").bytes());
    EXPECT_EQ("0x001", bitsOf("0x1", 10u).toHex());
    const std::pair<const char*, unsigned> tooShortOrBad[] = {
        {"0x1F", 4u}, {"0b111", 2u}, {"0x1", 0u}, {"0x1", kMaxDataBits + 1}};
    for (const auto& [text, bits] : tooShortOrBad) EXPECT_THROW(bitsOf(text, bits), UsageError) << text << " " << bits;
}

TEST(DataTextTest, BadDataIsAUsageError)
{
    for (const char* text : {"", "0x", "0b", "0x_", "0xG1", "12", "0b102", "0x1 2", "x1", "-1"})
        EXPECT_THROW(parseData(text, std::nullopt), UsageError) << text;
    EXPECT_THROW(parseData("0x" + std::string(kMaxDataBits / 4 + 1, 'F'), std::nullopt), UsageError);
    EXPECT_EQ(kMaxDataBits, parseData("0x" + std::string(kMaxDataBits / 4, 'F'), std::nullopt).bits.size());
}

TEST(IdcodeTest, HexAndBinaryNotations)
{
    EXPECT_EQ(0x0362D093u, parseIdcode("0x0362D093"));
    EXPECT_EQ(0x0362D093u, parseIdcode("0x362d093"));
    EXPECT_EQ(0x0362D093u, parseIdcode("00000011011000101101000010010011"));
    EXPECT_EQ(0x0362D093u, parseIdcode("0b0000_0011_0110_0010_1101_0000_1001_0011"));
    EXPECT_EQ(5u, parseIdcode("101")); // short: leading zeros
    EXPECT_EQ(0xFFFFFFFFu, parseIdcode("0xFFFFFFFF"));
    for (const char* text : {"0362D093", "0x1FFFFFFFF", "0x", "111111111111111111111111111111111", "", "0xZZ"})
        EXPECT_THROW(parseIdcode(text), UsageError) << text;
}

