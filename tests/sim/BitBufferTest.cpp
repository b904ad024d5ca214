// Bit buffers in the ABI's order, and the shift sources and sinks over them.
#include <gtest/gtest.h>

#include <random>

#include "BitBuffer.hpp"
#include "ShiftSink.hpp"
#include "ShiftSource.hpp"
#include "TextCopy.hpp"

using jexcable::BitBuffer;
using jexcable::ShiftSink;
using jexcable::ShiftSource;
using jexcable::TextCopy;

TEST(BitBuffer, BitIIsBitIMod8OfByteIDiv8)
{
    uint8_t b[2] = {0, 0};
    BitBuffer::set(b, 0, true);
    BitBuffer::set(b, 9, true);
    EXPECT_EQ(b[0], 0x01);
    EXPECT_EQ(b[1], 0x02);
    EXPECT_EQ(BitBuffer::load(b, 0, 16), 0x0201u);
    EXPECT_EQ(BitBuffer::bytesFor(9), 2u);
}

TEST(BitBuffer, WordsAtAnyOffsetMatchSingleBits)
{
    std::mt19937 rng(7);
    std::vector<uint8_t> src(40);
    for (auto& byte : src) byte = static_cast<uint8_t>(rng());
    for (int round = 0; round < 2000; ++round) {
        const unsigned n = 1 + rng() % 64;
        const uint64_t offset = rng() % (src.size() * 8 - n + 1);
        uint64_t expected = 0;
        for (unsigned i = 0; i < n; ++i)
            if (BitBuffer::get(src.data(), offset + i)) expected |= uint64_t{1} << i;
        ASSERT_EQ(BitBuffer::load(src.data(), offset, n), expected) << offset << "+" << n;

        std::vector<uint8_t> dst(40, 0xA5);
        const std::vector<uint8_t> before = dst;
        const uint64_t word = (uint64_t{rng()} << 32) | rng();
        BitBuffer::store(dst.data(), offset, n, word);
        for (uint64_t bit = 0; bit < dst.size() * 8; ++bit) {
            const bool inside = bit >= offset && bit < offset + n;
            const bool want = inside ? ((word >> (bit - offset)) & 1u) : BitBuffer::get(before.data(), bit);
            ASSERT_EQ(BitBuffer::get(dst.data(), bit), want) << "bit " << bit;
        }
    }
}

TEST(BitBuffer, MasksClearBitsOnBothSides)
{
    const uint8_t data[1] = {0xFF};
    const uint8_t mask[1] = {0x0F};
    EXPECT_EQ(ShiftSource::buffer(data, mask).word(0, 8), 0x0Fu) << "TDI outside the mask is driven low";
    EXPECT_EQ(ShiftSource::buffer(data, nullptr).word(0, 8), 0xFFu);
    EXPECT_EQ(ShiftSource::level(true).word(0, 5), 0x1Fu);
    EXPECT_FALSE(ShiftSource::level(false).bit(3));

    uint8_t out[1] = {0x00};
    ShiftSink sink = ShiftSink::buffer(out, mask);
    sink.put(0, 8, 0xFF);
    EXPECT_EQ(out[0], 0x0F) << "TDO outside the mask reads 0";
    uint8_t partial[1] = {0xF0};
    ShiftSink plain = ShiftSink::buffer(partial);
    plain.put(0, 3, 0x5);
    EXPECT_EQ(partial[0], 0xF5) << "bits beyond the shifted ones keep their values";
}

TEST(TextCopy, RepliesAreCutButReportTheFullLength)
{
    uint8_t out[8];
    uint32_t length = sizeof out;
    ASSERT_TRUE(TextCopy::toReply(out, &length, "0123456789"));
    EXPECT_EQ(length, 10u);
    EXPECT_STREQ(reinterpret_cast<char*>(out), "0123456");
    length = 0;
    EXPECT_TRUE(TextCopy::toReply(nullptr, &length, "abc"));
    EXPECT_EQ(length, 3u);
    length = 4;
    EXPECT_FALSE(TextCopy::toReply(nullptr, &length, "abc"));
    EXPECT_FALSE(TextCopy::toReply(out, nullptr, "abc"));

    const uint8_t in[] = {'k', 'e', 'y'};
    EXPECT_EQ(TextCopy::fromInput(in, 3), "key") << "no NUL needed within the given length";
    EXPECT_EQ(TextCopy::fromInput(in, 2), "ke");
    EXPECT_EQ(TextCopy::fromInput(nullptr, 5), "");
    char field[4];
    TextCopy::toField(field, "abcdef");
    EXPECT_STREQ(field, "abc");
}
