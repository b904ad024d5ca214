// SPDX-License-Identifier: MIT
// IDCode: the number of a text and pattern comparison.

#include <gtest/gtest.h>

#include <string>
#include <utility>

#include "jexjtag/rt/IDCode.hpp"

using JexRT::IDCode;

TEST(IDCode, TextComparesAsAPatternWithLeadingZeros)
{
    const std::string topX = "X" + std::string(30, '0') + "1";
    const struct {
        std::string text;
        unsigned value;
        bool equal;
    } cases[] = {
        {"101", 5u, true},  {"101", 7u, false}, {"1X1", 5u, true}, {"1X1", 7u, true},
        {"1x1", 5u, false}, {"1x1", 7u, false}, // lower-case x is an ordinary character
        {topX, 1u, true},   {topX, 0x80000001u, true}, {topX, 3u, false},
        {"", 0u, true},     {"", 1u, false},
    };
    for (const auto& c : cases) EXPECT_EQ(c.equal, IDCode(c.text) == c.value) << c.text << " == " << c.value;
    EXPECT_EQ(3u, IDCode(std::string("101")).length()); // kept as given
    EXPECT_TRUE(IDCode(std::string("1x1")) == std::string("1x1"));
    EXPECT_TRUE(IDCode(std::string("")) == IDCode(std::string("")));
}

TEST(IDCode, NumberOfAText)
{
    const std::pair<std::string, unsigned> numbers[] = {
        {"1" + std::string(32, '0'), 0u}, // 33 characters: the first shifts out
        {"1" + std::string(31, '0') + "1", 1u},
        {"1X1", 5u}, // don't-care positions count as 0
        {"1" + std::string(31, 'X'), 0x80000000u},
        {"", 0u},
    };
    for (const auto& [text, value] : numbers) EXPECT_EQ(value, IDCode(text).getIDCode32()) << text;
}
