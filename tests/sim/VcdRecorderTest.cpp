// SPDX-License-Identifier: MIT
// The waveform file: a well-formed VCD that follows what was driven.
#include <gtest/gtest.h>

#include <map>

#include "jexjtag/cable/JtagEngine.hpp"
#include "SimChain.hpp"
#include "SimTestSupport.hpp"
#include "VcdFile.hpp"
#include "VcdRecorder.hpp"
#include "support/TestSupport.hpp"

using jexcable::JtagEngine;
using jexsim::SimChain;
using jexsim::VcdRecorder;

TEST(VcdRecorder, RecordsPinsAndEveryTapState)
{
    testsupport::TempDir dir;
    const std::string path = (dir.path() / "trace.vcd").string();
    {
        SimChain chain({simtest::device(0x4BA00477, 4), simtest::noIdcode(3)});
        VcdRecorder recorder(path, chain, 10000000, true); // 10 MHz: 100 ns = 100000 ps a cycle
        chain.setObserver(&recorder);
        JtagEngine engine(chain);
        engine.resetTap();                   // 5 cycles
        engine.moveTo(JEXJTAG_SHIFT_DR);     // 4 cycles
        recorder.wait(2);                    // 2 us without clocks
        engine.moveTo(JEXJTAG_RUN_TEST_IDLE); // 3 cycles
        recorder.flush();
    }
    const std::string text = testsupport::readFile(path);
    EXPECT_EQ(text.rfind("$date ", 0), 0u);
    EXPECT_NE(text.find("$enddefinitions $end\n#0\n$dumpvars\n"), std::string::npos);
    const vcdtest::Vcd vcd = vcdtest::parse(path);
    ASSERT_TRUE(vcd.definitionsEnded);
    EXPECT_EQ(vcd.timescale, "1ps");
    std::map<std::string, int> byName;
    for (const auto& [id, name] : vcd.names) byName[name] = vcd.widths.at(id);
    EXPECT_EQ(byName, (std::map<std::string, int>{
                          {"tck", 1}, {"tms", 1}, {"tdi", 1}, {"tdo", 1}, {"dev0_state", 4}, {"dev1_state", 4},
                          {"dev0_tap", 1}, {"dev1_tap", 1}}));
    EXPECT_EQ(vcd.names.size(), 8u) << "identifiers are unique";
    EXPECT_EQ(vcd.initial.at("dev0_state"), "0000");
    EXPECT_EQ(vcd.initial.at("tck"), "0");
    ASSERT_FALSE(vcd.times.empty());
    for (std::size_t i = 1; i < vcd.times.size(); ++i) EXPECT_LT(vcd.times[i - 1], vcd.times[i]);

    // TCK rises once per cycle, half a period into it.
    const auto& tck = vcd.changes.at("tck");
    std::vector<uint64_t> rises;
    for (const auto& [t, v] : tck)
        if (v == "1") rises.push_back(t);
    ASSERT_EQ(rises.size(), 12u);
    EXPECT_EQ(rises[0], 50000u);
    EXPECT_EQ(rises[8], 850000u);
    EXPECT_EQ(rises[9], 950000u + 2000000u) << "the wait shows as a gap";

    // The state walk of device 1 at the rising edges: RTI, Select-DR, Capture-DR, Shift-DR, ...
    std::vector<std::string> states;
    for (const auto& [t, v] : vcd.changes.at("dev1_state")) states.push_back(v);
    EXPECT_EQ(states, (std::vector<std::string>{"0001", "0010", "0011", "0100", "0101", "1000", "0001"}));
    EXPECT_EQ(vcd.changes.at("dev0_state"), vcd.changes.at("dev1_state"));
    EXPECT_EQ(vcd.initial.at("dev1_tap"), "Test-Logic-Reset");
    std::vector<std::string> names;
    for (const auto& [t, v] : vcd.changes.at("dev1_tap")) names.push_back(v);
    EXPECT_EQ(names, (std::vector<std::string>{"Run-Test/Idle", "Select-DR-Scan", "Capture-DR", "Shift-DR", "Exit1-DR",
                                               "Update-DR", "Run-Test/Idle"}));
    // The final time stamp closes the last cycle.
    EXPECT_EQ(vcd.times.back(), 12 * 100000u + 2000000u);
}

TEST(VcdRecorder, UnwritablePathThrows)
{
    SimChain chain({});
    EXPECT_THROW(VcdRecorder("/nonexistent-dir/x.vcd", chain, 1000, true), std::runtime_error);
}
