// SPDX-License-Identifier: MIT
// Navigation, shifts and chain configuration through the exported TAP
// functions, checked against what reached the recording plug-in.

#include <gtest/gtest.h>

#include <chrono>

#include <cstring>
#include <string>
#include <vector>

#include "RecordingFixture.hpp"

using namespace targettest;
using testsupport::LogCapture;

namespace {

using TapApiTest = RecordingFixture;

struct Buffers {
    unsigned char tdi[4] = {0x80, 0x11, 0x22, 0x33};
    unsigned char tdo[4] = {};
    unsigned char tdiMask[4] = {0xFF, 0xFF, 0xFF, 0xFF};
    unsigned char tdoMask[4] = {0x0F, 0x0F, 0x0F, 0x0F};
};

using ShiftFn = uint32_t (*)(unsigned handle, unsigned deviceIndex, unsigned shiftMode, unsigned exitState,
                             void* callerData, unsigned bitCount, const unsigned char* tdi, unsigned char* tdo,
                             const unsigned char* tdiMask, const unsigned char* tdoMask);

uint32_t chainIR(unsigned h, unsigned, unsigned m, unsigned e, void* c, unsigned n, const unsigned char* i,
                 unsigned char* o, const unsigned char* im, const unsigned char* om)
{
    return JexJtag_tap_shiftChainIR(h, m, e, c, n, i, o, im, om);
}
uint32_t chainDR(unsigned h, unsigned, unsigned m, unsigned e, void* c, unsigned n, const unsigned char* i,
                 unsigned char* o, const unsigned char* im, const unsigned char* om)
{
    return JexJtag_tap_shiftChainDR(h, m, e, c, n, i, o, im, om);
}

struct ShiftCase {
    const char* name;   // the plug-in operations' stem
    ShiftFn call;
    bool device;
};

const ShiftCase kShifts[] = {
    {"shiftChainIR", chainIR, false},
    {"shiftDeviceIR", JexJtag_tap_shiftDeviceIR, true},
    {"shiftChainDR", chainDR, false},
    {"shiftDeviceDR", JexJtag_tap_shiftDeviceDR, true},
};

TEST_F(TapApiTest, ShiftModeSelectsOnePluginOperationWithArgumentsInOrder)
{
    const unsigned h = openTarget();
    const std::string ctx = " handle=" + std::to_string(h) + " callerData=0x77";
    void* const callerData = reinterpret_cast<void*>(0x77);
    for (const ShiftCase& s : kShifts) {
        SCOPED_TRACE(s.name);
        clearRecord();
        Buffers b;
        const std::string dev = s.device ? "deviceIndex=2 " : "";
        EXPECT_EQ(JEX_SUCCESS, s.call(h, 2, JEXJTAG_SHIFT_READWRITE, JEXJTAG_PAUSE_DR, callerData, 27, b.tdi, b.tdo,
                                      b.tdiMask, b.tdoMask));
        EXPECT_EQ(0x5A, b.tdo[0]); // the plug-in's answer lands in the caller's buffer
        EXPECT_EQ(JEX_SUCCESS, s.call(h, 2, JEXJTAG_SHIFT_READ, JEXJTAG_RUN_TEST_IDLE, callerData, 8, b.tdi, b.tdo,
                                      b.tdiMask, b.tdoMask));
        EXPECT_EQ(JEX_SUCCESS, s.call(h, 2, JEXJTAG_SHIFT_WRITE, JEXJTAG_UPDATE_IR, callerData, 9, b.tdi, b.tdo,
                                      b.tdiMask, b.tdoMask));
        // Only the two low bits count: 7 reads and writes, 4 does nothing.
        EXPECT_EQ(JEX_SUCCESS, s.call(h, 2, 7, JEXJTAG_PAUSE_IR, callerData, 5, b.tdi, b.tdo, b.tdiMask, b.tdoMask));
        EXPECT_EQ(JEX_FAILURE, s.call(h, 2, 4, JEXJTAG_PAUSE_IR, callerData, 5, b.tdi, b.tdo, b.tdiMask, b.tdoMask));

        const std::string tdi = "tdi=" + pointerText(b.tdi), tdo = "tdo=" + pointerText(b.tdo);
        const std::string tdiMask = " tdiMask=" + pointerText(b.tdiMask), tdoMask = " tdoMask=" + pointerText(b.tdoMask);
        const std::string rw = std::string(s.name) + "ReadWrite " + dev + tdi + " " + tdo + tdiMask + tdoMask;
        const std::vector<std::string> expected = {
            rw + " bitCount=27 exitState=6" + ctx,
            std::string(s.name) + "Read " + dev + "tdiLevel=1 " + tdo + tdoMask + " bitCount=8 exitState=1" + ctx,
            std::string(s.name) + "Write " + dev + tdi + tdiMask + " bitCount=9 exitState=15" + ctx,
            rw + " bitCount=5 exitState=13" + ctx,
        };
        EXPECT_EQ(expected, calls());
    }
}

TEST_F(TapApiTest, PluginStatusesComeBackUnchanged)
{
    const unsigned h = openTarget({"status.shiftDeviceDRWrite=0x80000007", "status.navigateTAP=0x80000003"});
    unsigned char tdi[1] = {1};
    EXPECT_EQ(0x80000007u, JexJtag_tap_shiftDeviceDR(h, 0, JEXJTAG_SHIFT_WRITE, 1, nullptr, 8, tdi, nullptr, nullptr,
                                                     nullptr));
    EXPECT_EQ(0x80000003u, JexJtag_tap_navigate(h, JEXJTAG_RUN_TEST_IDLE, 0, 0));
}

TEST_F(TapApiTest, ZeroBitShiftNavigatesToTheExitState)
{
    const unsigned h = openTarget();
    unsigned char tdi[1] = {0xFF};
    LogCapture log(3);
    for (const ShiftCase& s : kShifts) {
        SCOPED_TRACE(s.name);
        clearRecord();
        // Also with an invalid shift mode; the buffers are not touched.
        EXPECT_EQ(JEX_SUCCESS, s.call(h, 3, 9, JEXJTAG_RUN_TEST_IDLE, nullptr, 0, tdi, nullptr, nullptr, nullptr));
        EXPECT_EQ(std::vector<std::string>{"navigateTAP newState=1 clockRepeat=0"}, calls());
    }
    EXPECT_EQ(4u, log.count("Warning: bitCount = 0, using JexJtag_tap_navigate() instead.\n"));
    EXPECT_EQ(4u, log.count("JexJtag_tap_navigate() newState=JEXJTAG_RUN_TEST_IDLE\n"));
}

TEST_F(TapApiTest, NavigateFlushesAndWaitsOnlyWhenAskedAndTracesStateNames)
{
    const unsigned h = openTarget();
    const std::string hs = std::to_string(h);
    LogCapture log(3);
    EXPECT_EQ(JEX_SUCCESS, JexJtag_tap_navigate(h, JEXJTAG_SHIFT_IR, 4, 0));
    EXPECT_EQ(JEX_SUCCESS, JexJtag_tap_navigate(h, JEXJTAG_STATE_SIZE, 0, 999));
    const auto start = std::chrono::steady_clock::now();
    EXPECT_EQ(JEX_SUCCESS, JexJtag_tap_navigate(h, 40, 1, 2500));
    EXPECT_GE(std::chrono::steady_clock::now() - start, std::chrono::microseconds(2500)); // never less than asked
    const std::vector<std::string> expected = {
        "navigateTAP newState=11 clockRepeat=4", "navigateTAP newState=16 clockRepeat=0", "flush",
        "navigateTAP newState=40 clockRepeat=1", "flush"};
    EXPECT_EQ(expected, calls());

    EXPECT_TRUE(log.has("JexJtag_tap_navigate() newState=unknown(40)\n"));
    EXPECT_TRUE(log.has("Slept for 2500 microSeconds...\n"));
}

TEST_F(TapApiTest, ChainValuesAreReadAndSetThroughThePlugin)
{
    const unsigned h = openTarget({"devices=0362D093:6,1234567F:10"});
    unsigned count = 0;
    EXPECT_EQ(JEX_SUCCESS, JexJtag_tap_getDeviceCount(h, &count));
    EXPECT_EQ(2u, count);
    unsigned irlen = 0;
    EXPECT_EQ(JEX_SUCCESS, JexJtag_tap_getIRLength(h, 1, &irlen));
    EXPECT_EQ(10u, irlen);
    // An index the plug-in does not know: success with whatever it answers.
    EXPECT_EQ(JEX_SUCCESS, JexJtag_tap_getIRLength(h, 5, &irlen));
    EXPECT_EQ(0xFFFFFFFFu, irlen);
    EXPECT_EQ(JEX_SUCCESS, JexJtag_tap_setIRLength(h, 0, 8));
    EXPECT_EQ(JEX_SUCCESS, JexJtag_tap_setDeviceCount(h, 3));
    EXPECT_EQ(JEX_SUCCESS, JexJtag_tap_setDeviceIdcode(h, 2, "101"));
    EXPECT_EQ(JEX_FAILURE, JexJtag_tap_setDeviceIdcode(h, 2, nullptr));
    EXPECT_EQ(JEX_FAILURE, JexJtag_tap_setDeviceIdcode(h, 2, "0x0362D093")); // not an IDCODE text
    EXPECT_EQ(JEX_FAILURE, JexJtag_tap_getDeviceCount(h, nullptr));
    EXPECT_EQ(JEX_FAILURE, JexJtag_tap_getIRLength(h, 0, nullptr));

    const std::vector<std::string> expected = {
        "getDeviceCount",          "getIRLength deviceIndex=1", "getIRLength deviceIndex=5",
        "setIRLength deviceIndex=0 irLength=8", "setDeviceCount count=3",
        "setDeviceID deviceIndex=2 idcode=0x00000005"};
    EXPECT_EQ(expected, calls());
}

TEST_F(TapApiTest, DeviceIdcodeComesBackAsBitTextWithinTheBuffer)
{
    const unsigned h = openTarget({"devices=0362D093:6"});
    const std::string text = idcodeText(0x0362D093u);
    char buf[40];
    std::memset(buf, 'x', sizeof buf);
    EXPECT_EQ(JEX_SUCCESS, JexJtag_tap_getDeviceIdcode(h, 0, buf, 33));
    EXPECT_EQ(text, std::string(buf));
    EXPECT_EQ('x', buf[33]);

    std::memset(buf, 'x', sizeof buf);
    EXPECT_EQ(JEX_SUCCESS, JexJtag_tap_getDeviceIdcode(h, 0, buf, 32)); // no room for a terminator
    EXPECT_EQ(text, std::string(buf, 32));
    EXPECT_EQ('x', buf[32]);
    std::memset(buf, 'x', sizeof buf);
    EXPECT_EQ(JEX_SUCCESS, JexJtag_tap_getDeviceIdcode(h, 0, buf, 8));
    EXPECT_EQ(text.substr(0, 8), std::string(buf, 8));
    EXPECT_EQ(JEX_SUCCESS, JexJtag_tap_getDeviceIdcode(h, 0, nullptr, 0));
}

TEST_F(TapApiTest, BypassInstructionIsOnesOfTheIRLength)
{
    const unsigned h = openTarget({"devices=0362D093:6,00000001:0"});
    char buf[12];
    std::memset(buf, 'x', sizeof buf);
    EXPECT_EQ(JEX_SUCCESS, JexJtag_tap_getBypassCmd(h, 0, buf, 4));
    EXPECT_EQ("1111", std::string(buf, 4));
    EXPECT_EQ('x', buf[4]);
    std::memset(buf, 'x', sizeof buf);
    EXPECT_EQ(JEX_SUCCESS, JexJtag_tap_getBypassCmd(h, 0, buf, 10));
    EXPECT_EQ(std::string("111111\0\0\0\0", 10), std::string(buf, 10));
    // IR length 0, or an unknown device (-1): an empty instruction.
    EXPECT_EQ(JEX_SUCCESS, JexJtag_tap_getBypassCmd(h, 1, buf, 10));
    EXPECT_EQ(std::string(10, '\0'), std::string(buf, 10));
    EXPECT_EQ(JEX_SUCCESS, JexJtag_tap_getBypassCmd(h, 9, buf, 10));
    EXPECT_EQ(std::string(10, '\0'), std::string(buf, 10));
    EXPECT_EQ(JEX_FAILURE, JexJtag_tap_getBypassCmd(h, 0, nullptr, 10));
    // The plug-in is asked for the IR length, never for an instruction.
    for (const std::string& call : calls()) EXPECT_EQ(0u, call.find("getIRLength deviceIndex="));
    clearRecord();
    EXPECT_EQ(JEX_FAILURE, JexJtag_tap_setBypassCmd(h, 0, "111111"));
    EXPECT_TRUE(calls().empty());
}

TEST_F(TapApiTest, AutodetectStopsWhenInterrogationFailsAndIgnoresRefusedLengths)
{
    const unsigned h = openTarget({"devices=11111111:5", "fail=interrogate"});
    EXPECT_EQ(JEX_FAILURE, JexJtag_tap_autodetectChain(h, JEXJTAG_SCAN_DEFAULT));
    EXPECT_EQ(std::vector<std::string>{"interrogate"}, calls());
    // Interrogating alone ignores the algorithm and answers what the plug-in does.
    {
        EXPECT_EQ(JEX_FAILURE, JexJtag_tap_interrogateChain(h, 9));
    }
    JexJtag_target_close(h);

    EXPECT_EQ(JEX_SUCCESS, open("recording", {"devices=11111111:5", "fail=setIRLength"}));
    clearRecord();
    EXPECT_EQ(JEX_SUCCESS, JexJtag_tap_autodetectChain(h, 77));
    EXPECT_EQ(4u, calls().size());
    JexJtag_target_close(h);

    // A count no chain can have (a plug-in's error value) fails with a message.
    for (const char* count : {"count=0xFFFFFFFF", "count=0x80000000"}) {
        EXPECT_EQ(JEX_SUCCESS, open("recording", {count}));
        messages().clear();
        EXPECT_EQ(JEX_FAILURE, JexJtag_tap_autodetectChain(h, 0));
        ASSERT_EQ(1u, messages().size());
        EXPECT_NE(std::string::npos, messages()[0].text.find("a chain has at most 2048")) << messages()[0].text;
        JexJtag_target_close(h);
    }

    // An empty chain: one interrogation and one count.
    EXPECT_EQ(JEX_SUCCESS, open("recording"));
    clearRecord();
    EXPECT_EQ(JEX_SUCCESS, JexJtag_tap_autodetectChain(h, JEXJTAG_SCAN_TLRSHIFT));
    EXPECT_EQ(JEX_SUCCESS, JexJtag_tap_interrogateChain(h, JEXJTAG_SCAN_DEFAULT));
    EXPECT_EQ((std::vector<std::string>{"interrogate", "getDeviceCount", "interrogate"}), calls());
}

TEST_F(TapApiTest, EveryTapFunctionFailsWithoutATarget)
{
    const unsigned h = createSession();
    unsigned count = 5;
    unsigned irlen = 5;
    char idcode[8] = "keep";
    char bypass[4] = {'k', 'e', 'e', 'p'};
    unsigned char tdo[1] = {0x33};
    EXPECT_EQ(JEX_FAILURE, JexJtag_tap_autodetectChain(h, 0));
    EXPECT_EQ(JEX_FAILURE, JexJtag_tap_interrogateChain(h, 0));
    EXPECT_EQ(JEX_FAILURE, JexJtag_tap_getDeviceCount(h, &count));
    EXPECT_EQ(JEX_FAILURE, JexJtag_tap_setDeviceCount(h, 1));
    EXPECT_EQ(JEX_FAILURE, JexJtag_tap_getBypassCmd(h, 0, bypass, sizeof bypass));
    EXPECT_EQ(JEX_FAILURE, JexJtag_tap_setBypassCmd(h, 0, "1"));
    EXPECT_EQ(JEX_FAILURE, JexJtag_tap_getIRLength(h, 0, &irlen));
    EXPECT_EQ(JEX_FAILURE, JexJtag_tap_setIRLength(h, 0, 1));
    EXPECT_EQ(JEX_FAILURE, JexJtag_tap_getDeviceIdcode(h, 0, idcode, sizeof idcode));
    EXPECT_EQ(JEX_FAILURE, JexJtag_tap_setDeviceIdcode(h, 0, "1"));
    EXPECT_EQ(JEX_FAILURE, JexJtag_tap_navigate(h, 0, 0, 0));
    EXPECT_EQ(JEX_FAILURE, JexJtag_tap_shiftChainDR(h, 3, 1, nullptr, 8, tdo, tdo, nullptr, nullptr));
    EXPECT_EQ(JEX_FAILURE, JexJtag_tap_shiftDeviceIR(h, 0, 3, 1, nullptr, 0, tdo, tdo, nullptr, nullptr));
    // Outputs keep their values, except the IR length (0) and the IDCODE buffer (cleared).
    EXPECT_EQ(5u, count);
    EXPECT_EQ(0u, irlen);
    EXPECT_EQ(std::string(8, '\0'), std::string(idcode, 8));
    EXPECT_EQ(std::string("keep", 4), std::string(bypass, 4));
    EXPECT_EQ(0x33, tdo[0]);
    EXPECT_TRUE(calls().empty());
}

} // namespace
