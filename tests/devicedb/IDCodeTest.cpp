// IDCode: text and number forms, bit access and pattern comparison.

#include <gtest/gtest.h>

#include <string>

#include "jexjtag/rt/IDCode.hpp"

using JexRT::IDCode;

TEST(IDCode, DefaultAndNumberForms)
{
    const IDCode zero;
    EXPECT_EQ(std::string(32, '0'), zero.getIDCode());
    EXPECT_EQ(32u, zero.length());
    EXPECT_TRUE(zero == 0u);

    const IDCode five(5u);
    EXPECT_EQ(std::string(29, '0') + "101", five.getIDCode());
    EXPECT_EQ(5u, IDCode(five.getIDCode()).getIDCode32());
    EXPECT_EQ(0xFFFFFFFFu, IDCode(0xFFFFFFFFu).getIDCode32());
    EXPECT_EQ(0x4BA00477u, IDCode(IDCode(0x4BA00477u).getIDCode()).getIDCode32());
}

TEST(IDCode, TextIsKeptAsGivenAndComparesWithLeadingZeros)
{
    const IDCode shortText(std::string("101"));
    EXPECT_EQ(3u, shortText.length());
    EXPECT_TRUE(shortText == 5u);
    EXPECT_FALSE(shortText == 7u);
    EXPECT_EQ(5u, shortText.getIDCode32());

    EXPECT_TRUE(IDCode(std::string("1X1")) == 5u);
    EXPECT_TRUE(IDCode(std::string("1X1")) == 7u);
    EXPECT_FALSE(IDCode(std::string("1x1")) == 5u); // lower-case x is an ordinary character
    EXPECT_FALSE(IDCode(std::string("1x1")) == 7u);
    EXPECT_TRUE(IDCode(std::string("1x1")) == std::string("1x1"));

    const IDCode topDontCare(std::string("X") + std::string(30, '0') + "1");
    EXPECT_TRUE(topDontCare == 1u);
    EXPECT_TRUE(topDontCare == 0x80000001u);
    EXPECT_FALSE(topDontCare == 3u);

    const IDCode empty(std::string(""));
    EXPECT_TRUE(empty == 0u);
    EXPECT_EQ(0u, empty.getIDCode32());
    EXPECT_TRUE(empty == IDCode(std::string("")));
    EXPECT_FALSE(empty == 1u);
}

TEST(IDCode, NumberOfATextAndBitAccess)
{
    EXPECT_EQ(0u, IDCode("1" + std::string(32, '0')).getIDCode32()); // 33 characters: the first shifts out
    EXPECT_EQ(1u, IDCode("1" + std::string(31, '0') + "1").getIDCode32());
    // Don't-care positions count as 0.
    EXPECT_EQ(5u, IDCode(std::string("1X1")).getIDCode32());
    EXPECT_EQ(0x80000000u, IDCode("1" + std::string(31, 'X')).getIDCode32());

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

TEST(IDCode, SettersAndCopiesHaveTheirOwnText)
{
    IDCode a(std::string("1X"));
    IDCode b(a);
    a.setIDCode(3u);
    EXPECT_EQ("1X", b.getIDCode());
    EXPECT_EQ(32u, a.length());
    b = std::string("11");
    EXPECT_TRUE(a == b);
    b = 0u;
    EXPECT_EQ(std::string(32, '0'), b.getIDCode());
    b = a;
    EXPECT_EQ(a.getIDCode(), b.getIDCode());
    a.setIDCode(IDCode(std::string("0")));
    EXPECT_EQ("0", a.getIDCode());
}
