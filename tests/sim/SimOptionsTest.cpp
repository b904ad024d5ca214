// SPDX-License-Identifier: MIT
// Open arguments, options and the text form of a chain.
#include <gtest/gtest.h>

#include "ChainSpec.hpp"
#include "jexjtag/cable/PluginArgs.hpp"
#include "SimOptions.hpp"

using jexcable::PluginArgs;
using jexsim::ChainSpec;
using jexsim::DeviceSpec;
using jexsim::SimOptions;

TEST(ChainSpec, ParsesEntriesWithOptions)
{
    std::vector<DeviceSpec> d;
    std::string error;
    ASSERT_TRUE(ChainSpec::parse(" 0x4BA00477:4:idcode=0xE:USER=0b1010:userbits=35 , none:5:capture=0x5, 362d093:6",
                                 d, error))
        << error;
    ASSERT_EQ(d.size(), 3u);
    EXPECT_EQ(d[0].idcode, 0x4BA00477u);
    EXPECT_EQ(d[0].irLength, 4u);
    EXPECT_EQ(d[0].idcodeOpcode, 0xEu);
    EXPECT_EQ(d[0].userOpcode, 0xAu);
    EXPECT_EQ(d[0].userBits, 35u);
    EXPECT_FALSE(d[1].hasIdcode);
    EXPECT_EQ(d[1].irCapture, 5u);
    EXPECT_EQ(d[2].idcode, 0x0362D093u);
    EXPECT_EQ(d[2].idcodeOpcode, 1u);
    EXPECT_EQ(ChainSpec::format(d), "0x4BA00477:4:idcode=0xE:user=0xA:userbits=35,none:5:capture=0x5,0x0362D093:6");

    std::vector<DeviceSpec> again;
    ASSERT_TRUE(ChainSpec::parse(ChainSpec::format(d), again, error));
    EXPECT_EQ(ChainSpec::format(again), ChainSpec::format(d));
    ASSERT_TRUE(ChainSpec::parse("BYPASS:2", again, error));
    EXPECT_FALSE(again[0].hasIdcode);
    ASSERT_TRUE(ChainSpec::parse("  ", again, error));
    EXPECT_TRUE(again.empty());
}

TEST(ChainSpec, RejectsWhatNoDeviceCouldBe)
{
    const char* bad[] = {
        "0x4BA00477",             // no IR length
        "0x4BA00476:4",           // IDCODE bit 0 clear
        "0xFFFFFFFF:4",           // the end-of-chain pattern
        "0x123456789:4",          // more than 32 bits
        "xyz:4",                  // not hex
        "0x4BA00477:1",           // IR too short for the capture
        "0x4BA00477:65",          // too long
        "0x4BA00477:4:idcode=15", // IDCODE opcode is BYPASS
        "0x4BA00477:4:user=16",   // does not fit
        "0x4BA00477:4:idcode=2",  // same as the default user opcode
        "0x4BA00477:4:capture=2", // does not end in 01
        "0x4BA00477:4:userbits=0",
        "0x4BA00477:4:colour=3",
        "0x4BA00477:4:user",
        "0x4BA00477:4,,none:3",
    };
    for (const char* text : bad) {
        std::vector<DeviceSpec> d{DeviceSpec()};
        std::string error;
        EXPECT_FALSE(ChainSpec::parse(text, d, error)) << text;
        EXPECT_FALSE(error.empty()) << text;
        EXPECT_EQ(d.size(), 1u) << "a failed parse leaves the output alone: " << text;
    }
}

TEST(SimOptions, BadValuesChangeNothing)
{
    SimOptions o;
    const char* argv[] = {"port=other", "frequency=fast"};
    std::string error;
    EXPECT_FALSE(o.apply(PluginArgs(2, argv), error));
    EXPECT_NE(error.find("frequency"), std::string::npos);
    EXPECT_EQ(o.port, "sim0");

    for (const char* f : {"0", "2000M", "12x", "", "M"}) {
        uint64_t hz = 7;
        EXPECT_FALSE(SimOptions::parseFrequency(f, hz)) << f;
        EXPECT_EQ(hz, 7u);
    }
    uint64_t hz = 0;
    EXPECT_TRUE(SimOptions::parseFrequency("25M", hz));
    EXPECT_EQ(hz, 25000000u);
    EXPECT_FALSE(o.set("port", "  ", error));
    EXPECT_FALSE(o.set("new_firmware", "maybe", error));
    EXPECT_FALSE(o.set("chain", "0x2:4", error));
    EXPECT_EQ(o.chain.size(), 3u);
}

TEST(PluginArgs, KeysValuesAndOddEntries)
{
    const char* argv[] = {"a=1", nullptr, "flag", " B = x=y", "A=2"};
    PluginArgs args(5, argv);
    EXPECT_EQ(args.get("a").value_or(""), "2");
    EXPECT_EQ(args.get("b").value_or(""), " x=y") << "keys are trimmed, values are kept as given";
    EXPECT_TRUE(args.has("FLAG"));
    EXPECT_FALSE(args.has("c"));
    EXPECT_TRUE(PluginArgs(3, nullptr).entries().empty());
}
