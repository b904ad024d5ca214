// SPDX-License-Identifier: MIT
// IDCode: text and number forms, bit access and pattern comparison.

#include <gtest/gtest.h>

#include <string>
#include <utility>

#include "jexjtag/rt/IDCode.hpp"

using JexRT::IDCode;

TEST(IDCode, NumberFormsRoundTrip)
{
    EXPECT_EQ(std::string(32, '0'), IDCode().getIDCode());
    EXPECT_EQ(std::string(29, '0') + "101", IDCode(5u).getIDCode());
    for (unsigned v : {0u, 5u, 0xFFFFFFFFu, 0x4BA00477u}) EXPECT_EQ(v, IDCode(IDCode(v).getIDCode()).getIDCode32());
}

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

TEST(IDCode, NumberOfATextAndBitAccess)
{
    const std::pair<std::string, unsigned> numbers[] = {
        {"1" + std::string(32, '0'), 0u}, // 33 characters: the first shifts out
        {"1" + std::string(31, '0') + "1", 1u},
        {"1X1", 5u}, // don't-care positions count as 0
        {"1" + std::string(31, 'X'), 0x80000000u},
        {"", 0u},
    };
    for (const auto& [text, value] : numbers) EXPECT_EQ(value, IDCode(text).getIDCode32()) << text;

    const IDCode one(1u);
    EXPECT_EQ(1, one[31]);
    EXPECT_EQ(0, one[0]);
    EXPECT_EQ(0, one[32]);
    EXPECT_EQ(0, IDCode(0xFFFFFFFFu)[32]);
    const IDCode withX(std::string("1X0"));
    EXPECT_EQ(1, withX[0]);
    EXPECT_EQ(0, withX[1]);
    EXPECT_EQ(0, withX[2]);
}

TEST(IDCode, CopiesHaveTheirOwnText)
{
    IDCode a(std::string("1X"));
    IDCode b(a);
    a.setIDCode(3u);
    EXPECT_EQ("1X", b.getIDCode());
    b = std::string("11");
    EXPECT_TRUE(a == b);
    b = a;
    a.setIDCode(IDCode(std::string("0")));
    EXPECT_EQ("0", a.getIDCode());
    EXPECT_EQ(std::string(30, '0') + "11", b.getIDCode());
}
