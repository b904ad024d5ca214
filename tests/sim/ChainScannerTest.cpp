// SPDX-License-Identifier: MIT
// Chain interrogation: IDCODEs, device count and the IR-length heuristic.
#include <gtest/gtest.h>

#include "jexjtag/cable/ChainScanner.hpp"
#include "SimChain.hpp"
#include "SimOptions.hpp"
#include "SimTestSupport.hpp"

using jexcable::ChainScanner;
using jexcable::JtagEngine;
using jexsim::DeviceSpec;
using jexsim::SimChain;

namespace {

ChainScanner::Result scan(const std::vector<DeviceSpec>& specs, bool expectOk = true,
                          ChainScanner::Limits limits = ChainScanner::Limits())
{
    SimChain chain(specs);
    JtagEngine engine(chain);
    engine.resetTap();
    ChainScanner::Result result;
    EXPECT_EQ(ChainScanner(engine, limits).scan(result), expectOk) << result.error;
    EXPECT_EQ(engine.state(), JEXJTAG_TEST_LOGIC_RESET);
    for (std::size_t d = 0; d < chain.size(); ++d) EXPECT_EQ(chain.device(d).state(), JEXJTAG_TEST_LOGIC_RESET);
    return result;
}

std::vector<bool> pattern(const std::string& bitsFirstOut)
{
    std::vector<bool> v;
    for (const char c : bitsFirstOut) v.push_back(c == '1');
    return v;
}

} // namespace

TEST(ChainScanner, FindsEveryDeviceWithItsIrLength)
{
    std::vector<DeviceSpec> longChain;
    for (uint32_t i = 0; i < 40; ++i) longChain.push_back(simtest::device(0x00000001u | (i << 12), 2 + (i * 7) % 63));
    const std::vector<std::vector<DeviceSpec>> chains = {
        jexsim::SimOptions::defaultChain(),
        // Devices without IDCODE are counted with IDCODE 0.
        {simtest::noIdcode(3), simtest::device(0x0362D093, 6), simtest::noIdcode(2), simtest::device(0x41111043, 8)},
        {}, // a wire
        longChain,
    };
    for (const auto& specs : chains) {
        const auto r = scan(specs);
        ASSERT_EQ(r.devices.size(), specs.size());
        uint32_t irBits = 0;
        for (std::size_t d = 0; d < specs.size(); ++d) {
            EXPECT_EQ(r.devices[d].idcode, specs[d].hasIdcode ? specs[d].idcode : 0u) << d;
            EXPECT_EQ(r.hasIdcode[d], specs[d].hasIdcode) << d;
            EXPECT_EQ(r.devices[d].irLength, specs[d].irLength) << d;
            irBits += specs[d].irLength;
        }
        EXPECT_FALSE(r.ambiguous);
        EXPECT_EQ(r.irCapture.size(), irBits);
    }
}

TEST(ChainScanner, SplitRule)
{
    struct Case {
        const char* firstOut;
        uint32_t devices;
        std::vector<uint32_t> lengths;
        bool ambiguous;
    };
    const Case cases[] = {
        {"1000" "100000" "10", 3, {4, 6, 2}, false}, // every device captures ...01
        {"1011" "10", 2, {4, 2}, false},              // upper 1s that do not form 1,0 are no boundary
        {"10" "1000" "1000", 2, {6, 4}, true},        // the shortest neighbouring pair is joined
        {"1000" "1000" "10", 2, {4, 6}, true},        // ... here the pair at the TDI end
        {"100" "100" "100", 2, {6, 3}, true},         // a tie goes to the pair nearest TDO
        {"10" "10" "10", 1, {6}, true},               // one device takes everything
    };
    for (const Case& c : cases) {
        std::vector<uint32_t> lengths;
        bool ambiguous = !c.ambiguous;
        std::string error;
        ASSERT_TRUE(ChainScanner::splitIr(pattern(c.firstOut), c.devices, lengths, ambiguous, error)) << c.firstOut;
        EXPECT_EQ(lengths, c.lengths) << c.firstOut;
        EXPECT_EQ(ambiguous, c.ambiguous) << c.firstOut;
    }
}

TEST(ChainScanner, SplitRuleRefusesWhatIeeeForbids)
{
    std::vector<uint32_t> lengths;
    bool ambiguous = false;
    std::string error;
    EXPECT_FALSE(ChainScanner::splitIr(pattern("0100"), 1, lengths, ambiguous, error));
    EXPECT_NE(error.find("01"), std::string::npos);
    EXPECT_FALSE(ChainScanner::splitIr(pattern("100000"), 2, lengths, ambiguous, error));
    EXPECT_FALSE(ChainScanner::splitIr(pattern("10"), 2, lengths, ambiguous, error));
    EXPECT_FALSE(ChainScanner::splitIr(pattern("10"), 0, lengths, ambiguous, error));
    EXPECT_TRUE(ChainScanner::splitIr(pattern(""), 0, lengths, ambiguous, error));
    EXPECT_TRUE(lengths.empty());
}

TEST(ChainScanner, LimitsAreReportedNotOverrun)
{
    ChainScanner::Limits few;
    few.maxDevices = 2;
    const auto r = scan(jexsim::SimOptions::defaultChain(), false, few);
    EXPECT_TRUE(r.devices.empty());
    EXPECT_NE(r.error.find("2 devices"), std::string::npos) << r.error;

    // The 18-bit IR of the default chain against shorter limits: the message
    // names the limit (never "too few bits" from captured bits left behind).
    for (uint32_t bits : {16u, 4u}) {
        ChainScanner::Limits shortIr;
        shortIr.maxIrBits = bits;
        const auto s = scan(jexsim::SimOptions::defaultChain(), false, shortIr);
        EXPECT_EQ("the instruction registers are longer than " + std::to_string(bits) +
                      " bits, the most an interrogation reads",
                  s.error);
    }
}
