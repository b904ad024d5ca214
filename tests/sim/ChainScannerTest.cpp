// Chain interrogation: IDCODEs, device count and the IR-length heuristic.
#include <gtest/gtest.h>

#include "ChainScanner.hpp"
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

TEST(ChainScanner, FindsTheDefaultChain)
{
    const auto r = scan(jexsim::SimOptions::defaultChain());
    ASSERT_EQ(r.devices.size(), 3u);
    EXPECT_EQ(r.devices[0].idcode, 0x4BA00477u);
    EXPECT_EQ(r.devices[1].idcode, 0x0362D093u);
    EXPECT_EQ(r.devices[2].idcode, 0x41111043u);
    EXPECT_EQ(r.devices[0].irLength, 4u);
    EXPECT_EQ(r.devices[1].irLength, 6u);
    EXPECT_EQ(r.devices[2].irLength, 8u);
    EXPECT_FALSE(r.ambiguous);
    EXPECT_EQ(r.irCapture.size(), 18u);
}

TEST(ChainScanner, DeviceWithoutIdcodeIsCountedWithIdcodeZero)
{
    const auto r = scan({simtest::noIdcode(3), simtest::device(0x0362D093, 6), simtest::noIdcode(2),
                         simtest::device(0x41111043, 8)});
    ASSERT_EQ(r.devices.size(), 4u);
    EXPECT_EQ(r.devices[0].idcode, 0u);
    EXPECT_FALSE(r.hasIdcode[0]);
    EXPECT_EQ(r.devices[1].idcode, 0x0362D093u);
    EXPECT_TRUE(r.hasIdcode[1]);
    EXPECT_EQ(r.devices[2].idcode, 0u);
    EXPECT_EQ(r.devices[3].idcode, 0x41111043u);
    EXPECT_EQ(r.devices[0].irLength, 3u);
    EXPECT_EQ(r.devices[1].irLength, 6u);
    EXPECT_EQ(r.devices[2].irLength, 2u);
    EXPECT_EQ(r.devices[3].irLength, 8u);
}

TEST(ChainScanner, EmptyChainIsAWire)
{
    const auto r = scan({});
    EXPECT_TRUE(r.devices.empty());
    EXPECT_TRUE(r.irCapture.empty());
}

TEST(ChainScanner, LongChainAndLongRegisters)
{
    std::vector<DeviceSpec> specs;
    for (uint32_t i = 0; i < 40; ++i) specs.push_back(simtest::device(0x00000001u | (i << 12), 2 + (i * 7) % 63));
    const auto r = scan(specs);
    ASSERT_EQ(r.devices.size(), 40u);
    for (uint32_t i = 0; i < 40; ++i) {
        EXPECT_EQ(r.devices[i].idcode, specs[i].idcode);
        EXPECT_EQ(r.devices[i].irLength, specs[i].irLength);
    }
}

TEST(ChainScanner, StatusBitsThatLookLikeABoundaryAreJoinedBack)
{
    // Device 0 captures binary 000101 (first out: 1,0,1,0,0,0): a stray 1,0.
    const auto r = scan({simtest::device(0x0362D093, 6, 0x09, 0x02, 32, 0x05), simtest::device(0x4BA00477, 4)});
    ASSERT_EQ(r.devices.size(), 2u);
    EXPECT_TRUE(r.ambiguous);
    EXPECT_EQ(r.devices[0].irLength, 6u);
    EXPECT_EQ(r.devices[1].irLength, 4u);
}

TEST(ChainScanner, SplitRule)
{
    std::vector<uint32_t> lengths;
    bool ambiguous = false;
    std::string error;
    // Unique: every device captures ...01.
    ASSERT_TRUE(ChainScanner::splitIr(pattern("1000" "100000" "10"), 3, lengths, ambiguous, error));
    EXPECT_EQ(lengths, (std::vector<uint32_t>{4, 6, 2}));
    EXPECT_FALSE(ambiguous);
    // Upper bits of 1s that do not form 1,0 are no boundary.
    ASSERT_TRUE(ChainScanner::splitIr(pattern("1011" "10"), 2, lengths, ambiguous, error));
    EXPECT_EQ(lengths, (std::vector<uint32_t>{4, 2}));
    EXPECT_FALSE(ambiguous);
    // Pieces 2,4,4 for two devices: the shortest neighbouring pair is joined.
    ASSERT_TRUE(ChainScanner::splitIr(pattern("10" "1000" "1000"), 2, lengths, ambiguous, error));
    EXPECT_EQ(lengths, (std::vector<uint32_t>{6, 4}));
    EXPECT_TRUE(ambiguous);
    // Pieces 4,4,2: the pair at the TDI end is shorter.
    ASSERT_TRUE(ChainScanner::splitIr(pattern("1000" "1000" "10"), 2, lengths, ambiguous, error));
    EXPECT_EQ(lengths, (std::vector<uint32_t>{4, 6}));
    // A tie goes to the pair nearest TDO.
    ASSERT_TRUE(ChainScanner::splitIr(pattern("100" "100" "100"), 2, lengths, ambiguous, error));
    EXPECT_EQ(lengths, (std::vector<uint32_t>{6, 3}));
    // One device takes everything.
    ASSERT_TRUE(ChainScanner::splitIr(pattern("10" "10" "10"), 1, lengths, ambiguous, error));
    EXPECT_EQ(lengths, (std::vector<uint32_t>{6}));
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

    ChainScanner::Limits shortIr;
    shortIr.maxIrBits = 16;
    const auto s = scan(jexsim::SimOptions::defaultChain(), false, shortIr);
    EXPECT_NE(s.error.find("16 bits"), std::string::npos) << s.error;
}
