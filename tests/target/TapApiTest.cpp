// Navigation, shifts and chain configuration through the exported TAP
// functions, checked against what reached the recording plug-in.

#include <gtest/gtest.h>

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
    EXPECT_EQ(JEX_SUCCESS, JexJtag_tap_navigate(h, 40, 1, 2500));
    const std::vector<std::string> expected = {
        "navigateTAP newState=11 clockRepeat=4", "navigateTAP newState=16 clockRepeat=0", "flush",
        "navigateTAP newState=40 clockRepeat=1", "flush"};
    EXPECT_EQ(expected, calls());

    EXPECT_TRUE(log.has("JexJtag_tap_navigate() handle=" + hs + ", clockRepeat=4, microSeconds=0\n"));
    EXPECT_TRUE(log.has("JexJtag_tap_navigate() newState=JEXJTAG_SHIFT_IR\n"));
    EXPECT_TRUE(log.has("nagivateTAP(newState=JEXJTAG_SHIFT_IR, clockRepeat=4) returning JEX_SUCCESS\n"));
    EXPECT_TRUE(log.has("JexJtag_tap_navigate() newState=JEXJTAG_STATE_SIZE\n"));
    EXPECT_TRUE(log.has("nagivateTAP(newState=, clockRepeat=0) returning JEX_SUCCESS\n"));
    EXPECT_TRUE(log.has("Slept for 999 microSeconds...\n"));
    EXPECT_TRUE(log.has("JexJtag_tap_navigate() newState=unknown(40)\n"));
    EXPECT_TRUE(log.has("nagivateTAP(newState=unknown(40), clockRepeat=1) returning JEX_SUCCESS\n"));
    EXPECT_TRUE(log.has("Slept for 2500 microSeconds...\n"));
}

TEST_F(TapApiTest, ShiftTracesAndDumpsFollowTheMode)
{
    const unsigned h = openTarget();
    const std::string hs = std::to_string(h);
    Buffers b;
    {
        LogCapture log(5);
        EXPECT_EQ(JEX_SUCCESS, JexJtag_tap_shiftDeviceIR(h, 1, JEXJTAG_SHIFT_READWRITE, JEXJTAG_UPDATE_IR, nullptr, 12,
                                                         b.tdi, b.tdo, nullptr, b.tdoMask));
        EXPECT_TRUE(log.has("JexJtag_tap_shiftDeviceIR() handle=" + hs + ", deviceIndex=1, bitCount=12\n"));
        EXPECT_TRUE(log.has("JexJtag_tap_shiftDeviceIR() shiftMode=JEXJTAG_SHIFT_READWRITE\n"));
        EXPECT_TRUE(log.has("JexJtag_tap_shiftDeviceIR() exitState=JEXJTAG_UPDATE_IR\n"));
        EXPECT_TRUE(log.has("shiftDeviceIR(deviceIndex=1, tdibuf=" + tracedPointer(b.tdi) + ", tdobuf=" +
                            tracedPointer(b.tdo) + ", tdimask=NULL, tdomask=" + tracedPointer(b.tdoMask) +
                            ", bitCount=12, shiftMode=RW, exitState=JEXJTAG_UPDATE_IR) returning JEX_SUCCESS\n"));
        const std::string text = log.text();
        EXPECT_NE(std::string::npos, text.find("TDI BUFFER BEFORE SHIFTDEVICEIR:"));
        EXPECT_NE(std::string::npos, text.find("TDO BUFFER AFTER SHIFTDEVICEIR:"));
        EXPECT_NE(std::string::npos, text.find(" 80 11\n")); // 12 bits: two bytes of TDI
        EXPECT_NE(std::string::npos, text.find(" 5A 5A\n"));
    }
    clearRecord();
    {
        // Read only: no TDI dump.
        LogCapture log(5);
        EXPECT_EQ(JEX_SUCCESS, JexJtag_tap_shiftChainIR(h, JEXJTAG_SHIFT_READ, 1, nullptr, 8, b.tdi, b.tdo, nullptr,
                                                        nullptr));
        EXPECT_EQ(std::string::npos, log.text().find("TDI BUFFER"));
        EXPECT_NE(std::string::npos, log.text().find("TDO BUFFER AFTER SHIFTCHAINIR:"));
        EXPECT_NE(std::string::npos, log.text().find("shiftMode=R, exitState=JEXJTAG_RUN_TEST_IDLE) returning"));
    }
    {
        // Write only: no TDO dump.
        LogCapture log(5);
        EXPECT_EQ(JEX_SUCCESS, JexJtag_tap_shiftChainDR(h, JEXJTAG_SHIFT_WRITE, 1, nullptr, 8, b.tdi, b.tdo, nullptr,
                                                        nullptr));
        EXPECT_EQ(std::string::npos, log.text().find("TDO BUFFER"));
        EXPECT_NE(std::string::npos, log.text().find("TDI BUFFER BEFORE SHIFTCHAINDR:"));
    }
    {
        // No mode bit: the full trace line, an empty mode text, no call.
        LogCapture log(3);
        EXPECT_EQ(JEX_FAILURE, JexJtag_tap_shiftChainDR(h, 0, 99, nullptr, 8, b.tdi, b.tdo, nullptr, nullptr));
        EXPECT_TRUE(log.has("JexJtag_tap_shiftChainDR() shiftMode=unknown(0)\n"));
        EXPECT_TRUE(log.has("JexJtag_tap_shiftChainDR() exitState=unknown(99)\n"));
        EXPECT_NE(std::string::npos,
                  log.text().find("bitCount=8, shiftMode=, exitState=unknown(99)) returning JEX_FAILURE\n"));
    }
    const std::vector<std::string> got = calls();
    ASSERT_EQ(2u, got.size());
    // The write-only call hands the plug-in no TDO buffer or mask.
    EXPECT_EQ("shiftChainDRWrite tdi=" + pointerText(b.tdi) + " tdiMask=null bitCount=8 exitState=1 handle=" + hs +
                  " callerData=null",
              got[1]);
}

TEST_F(TapApiTest, AMegabitShiftIsDumpedWholeAtLevelFive)
{
    const unsigned h = openTarget();
    constexpr unsigned kBits = 1u << 20;
    std::vector<unsigned char> tdi(kBits / 8, 0xC3);
    std::vector<unsigned char> tdo(kBits / 8, 0);
    tdi.back() = 0x7E;
    LogCapture log(5);
    EXPECT_EQ(JEX_SUCCESS, JexJtag_tap_shiftChainDR(h, JEXJTAG_SHIFT_READWRITE, JEXJTAG_RUN_TEST_IDLE, nullptr, kBits,
                                                    tdi.data(), tdo.data(), nullptr, nullptr));
    EXPECT_EQ(0x5A, tdo.back());
    const std::string text = log.text();
    const size_t tdiAt = text.find("TDI BUFFER BEFORE SHIFTCHAINDR: (1048576 bits)\n");
    const size_t tdoAt = text.find("TDO BUFFER AFTER SHIFTCHAINDR: (1048576 bits)\n");
    ASSERT_NE(std::string::npos, tdiAt);
    ASSERT_NE(std::string::npos, tdoAt);
    ASSERT_LT(tdiAt, tdoAt);
    // 131072 bytes, 32 to a line: the last line of each dump starts at 0x1FFE0.
    const std::string lastTdi = "  0001FFE0:" + [] {
        std::string bytes;
        for (int i = 0; i < 31; ++i) bytes += " C3";
        return bytes + " 7E\n";
    }();
    EXPECT_NE(std::string::npos, text.find(lastTdi, tdiAt));
    EXPECT_LT(text.find(lastTdi, tdiAt), tdoAt);
    EXPECT_NE(std::string::npos, text.find("  0001FFE0: 5A 5A", tdoAt));
    EXPECT_TRUE(log.has("shiftChainDR(tdibuf=" + tracedPointer(tdi.data()) + ", tdobuf=" + tracedPointer(tdo.data()) +
                        ", tdimask=NULL, tdomask=NULL, bitCount=1048576, shiftMode=RW, "
                        "exitState=JEXJTAG_RUN_TEST_IDLE) returning JEX_SUCCESS\n"));
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
    LogCapture log(3);
    EXPECT_EQ(JEX_SUCCESS, JexJtag_tap_getDeviceIdcode(h, 0, buf, 33));
    EXPECT_EQ(text, std::string(buf));
    EXPECT_EQ('x', buf[33]);
    EXPECT_TRUE(log.has("getDeviceIdcode(deviceIndex=0) returning 362d093\n"));
    EXPECT_TRUE(log.has("JexJtag_tap_getDeviceIdcode() returning idcode=" + text + "\n"));

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

// What autodetect sets is checked end to end (tests/e2e); here its trace.
TEST_F(TapApiTest, AutodetectSetsIRLengthsFromTheDeviceDatabase)
{
    const unsigned h = openTarget({"devices=11111111:5,2345678F:9,33333333:7"});
    const std::string list = idcodeText(0x2345678Fu) + " 6 1 0 TESTDEVICE\n";
    ASSERT_EQ(JEX_SUCCESS, JexJtag_db_addDeviceData(h, "test.lst", list.c_str(), static_cast<unsigned>(list.size())));
    LogCapture log(3);
    EXPECT_EQ(JEX_SUCCESS, JexJtag_tap_autodetectChain(h, JEXJTAG_SCAN_WALKING_ONES));
    const std::string hs = std::to_string(h);
    EXPECT_TRUE(log.has("JexJtag_tap_autodetectChain() handle=" + hs + ", algorithm=JEXJTAG_SCAN_WALKING_ONES\n"));
    EXPECT_TRUE(log.has("JexJtag_tap_autodetectChain() handle=" + hs + "\n"));
    EXPECT_TRUE(log.has("setIRLength(deviceIndex=1, irlen=6) returning JEX_SUCCESS\n"));
}

TEST_F(TapApiTest, AutodetectStopsWhenInterrogationFailsAndIgnoresRefusedLengths)
{
    const unsigned h = openTarget({"devices=11111111:5", "fail=interrogate"});
    EXPECT_EQ(JEX_FAILURE, JexJtag_tap_autodetectChain(h, JEXJTAG_SCAN_DEFAULT));
    EXPECT_EQ(std::vector<std::string>{"interrogate"}, calls());
    // Interrogating alone ignores the algorithm and answers what the plug-in does.
    {
        LogCapture log(3);
        EXPECT_EQ(JEX_FAILURE, JexJtag_tap_interrogateChain(h, 9));
        EXPECT_TRUE(log.has("JexJtag_tap_interrogateChain() handle=" + std::to_string(h) + ", algorithm=9\n"));
        EXPECT_TRUE(log.has("interrogate() returning JEX_FAILURE\n"));
    }
    JexJtag_target_close(h);

    EXPECT_EQ(JEX_SUCCESS, open("recording", {"devices=11111111:5", "fail=setIRLength"}));
    clearRecord();
    EXPECT_EQ(JEX_SUCCESS, JexJtag_tap_autodetectChain(h, 77));
    EXPECT_EQ(4u, calls().size());
    JexJtag_target_close(h);

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
