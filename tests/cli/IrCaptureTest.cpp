// SPDX-License-Identifier: MIT
// IR lengths from a chain's IR capture where some devices' lengths are known:
// the cases the program's scan tests do not reach (several unknown runs,
// ambiguity, captures that make no sense).

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "IrCapture.hpp"

using jexjtag::cli::inferUnknownIrLengths;

namespace {

// Capture bits first out first, written as text: "1000" is a 4-bit IR.
std::vector<bool> bits(const std::string& text)
{
    std::vector<bool> out;
    for (char c : text) out.push_back(c == '1');
    return out;
}

} // namespace

TEST(IrCapture, UnknownLengthsComeFromTheBitsTheKnownOnesLeave)
{
    const struct {
        const char* capture;
        std::vector<unsigned> known, expected;
        bool ok, ambiguous;
    } cases[] = {
        {"1000" "10000" "100000", {4, 0, 6}, {4, 5, 6}, true, false},
        {"1000" "10100" "100000", {4, 0, 6}, {4, 5, 6}, true, false},    // one device: the segment is its IR
        {"1000" "10" "1010" "100000", {4, 0, 0, 6}, {4, 4, 2, 6}, true, true}, // 2,2,2: the pair nearest TDO joins
        {"1000" "100" "1000" "10", {4, 0, 4, 0}, {4, 3, 4, 2}, true, false}, // two runs: the whole split
        {"1000" "100" "100" "10", {4, 0, 6, 0}, {}, false, false},       // a known 6 where the capture shows 3,2
        {"10" "00", {0, 0}, {}, false, false},                           // one IR start for two devices
        {"1000", {4, 4}, {4, 4}, true, false},                           // nothing to infer
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.capture);
        const auto result = inferUnknownIrLengths(bits(c.capture), c.known);
        EXPECT_EQ(c.ok, result.ok) << result.error;
        if (!c.ok) continue;
        EXPECT_EQ(c.expected, result.lengths);
        EXPECT_EQ(c.ambiguous, result.ambiguous);
    }
}
