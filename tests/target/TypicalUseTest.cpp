// The road of a typical host, end to end through the C API: create a
// session, list the targets, open one, lock it, autodetect the chain, shift
// into one device, unlock, close and destroy.

#include <gtest/gtest.h>

#include <algorithm>
#include <cstring>
#include <string>
#include <vector>

#include "RecordingFixture.hpp"

using namespace targettest;

namespace {

using TypicalUseTest = RecordingFixture;

TEST_F(TypicalUseTest, CreateListOpenLockAutodetectShiftUnlockCloseDestroy)
{
    unsigned h = 0;
    ASSERT_EQ(JEX_SUCCESS, JexJtag_session_create(keepMessage, 0, nullptr, &h));
    m_handle = h;

    // The targets the plug-in tree offers; find ours by name.
    unsigned count = 0;
    ASSERT_EQ(JEX_SUCCESS, JexJtag_session_getTargetCount(h, &count));
    int index = -1;
    for (unsigned i = 0; i < count; ++i) {
        unsigned size = 0;
        ASSERT_EQ(JEX_SUCCESS, JexJtag_session_getTargetXMLSizeByIndex(h, i, &size));
        std::vector<char> xml(size);
        char name[64];
        char plugin[64];
        ASSERT_EQ(JEX_SUCCESS, JexJtag_session_getTargetByIndex(h, i, xml.data(), size, name, sizeof name, plugin,
                                                                sizeof plugin));
        if (std::string(name) == "recording") {
            index = static_cast<int>(i);
            EXPECT_STREQ("RecordingPlugin", plugin);
            EXPECT_NE(nullptr, std::strstr(xml.data(), "<targetname>recording</targetname>"));
        }
    }
    ASSERT_GE(index, 0);

    // The database knows the second device of the chain, not the first.
    const std::string list = bits(0x0362D093u) + " 6 1 0 SOMEFPGA\n";
    ASSERT_EQ(JEX_SUCCESS, JexJtag_db_addDeviceData(h, "mine.lst", list.c_str(), static_cast<unsigned>(list.size())));

    const char* args[] = {"devices=00000001:4,0362D093:3"};
    JexJtagTargetInfo info{};
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_open(h, "recording", nullptr, 1, args, &info));
    EXPECT_STREQ("recording", info.target_name);

    unsigned lockStatus = 0;
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_lock(h, 1000, &lockStatus));
    EXPECT_EQ(unsigned{JEXJTAG_LOCKED_ME}, lockStatus);
    ASSERT_EQ(JEX_SUCCESS, JexJtag_tap_autodetectChain(h, JEXJTAG_SCAN_DEFAULT));
    unsigned irlen = 0;
    ASSERT_EQ(JEX_SUCCESS, JexJtag_tap_getIRLength(h, 1, &irlen));
    EXPECT_EQ(6u, irlen);

    const unsigned char instruction[1] = {0x09};
    unsigned char dr[4] = {};
    const unsigned char zeros[4] = {};
    void* const callerData = reinterpret_cast<void*>(0x42);
    ASSERT_EQ(JEX_SUCCESS, JexJtag_tap_shiftDeviceIR(h, 1, JEXJTAG_SHIFT_WRITE, JEXJTAG_UPDATE_IR, callerData, 6,
                                                     instruction, nullptr, nullptr, nullptr));
    ASSERT_EQ(JEX_SUCCESS, JexJtag_tap_shiftDeviceDR(h, 1, JEXJTAG_SHIFT_READWRITE, JEXJTAG_RUN_TEST_IDLE, callerData,
                                                     32, zeros, dr, nullptr, nullptr));
    EXPECT_EQ(0x5A, dr[3]);

    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_unlock(h));
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_close(h));
    ASSERT_EQ(JEX_SUCCESS, JexJtag_session_destroy(h));
    m_handle = kNoSession;

    const std::string hs = std::to_string(h);
    const std::vector<std::string> expected = {
        "JexPlugin_create",
        "setSessionHandle handle=" + hs,
        "openTarget argc=2 argv=[devices=00000001:4,0362D093:3|type=recording] handle=" + hs + " callerData=null",
        "", // getTargetInfo, checked below
        "lockTarget msWait=1000",
        "interrogate",
        "getDeviceCount",
        "getDeviceIdcode deviceIndex=0",
        "setIRLength deviceIndex=0 irLength=0",
        "getDeviceIdcode deviceIndex=1",
        "setIRLength deviceIndex=1 irLength=6",
        "getIRLength deviceIndex=1",
        "shiftDeviceIRWrite deviceIndex=1 tdi=" + pointerText(instruction) + " tdiMask=null bitCount=6 exitState=15 handle=" +
            hs + " callerData=0x42",
        "shiftDeviceDRReadWrite deviceIndex=1 tdi=" + pointerText(zeros) + " tdo=" + pointerText(dr) +
            " tdiMask=null tdoMask=null bitCount=32 exitState=1 handle=" + hs + " callerData=0x42",
        "unlockTarget",
        "closeTarget",
        "", // JexPlugin_destroy
    };
    std::vector<std::string> got = calls();
    ASSERT_EQ(expected.size(), got.size());
    EXPECT_EQ(0u, got[3].find("getTargetInfo "));
    EXPECT_EQ(0u, got[16].find("JexPlugin_destroy "));
    got[3].clear();
    got[16].clear();
    EXPECT_EQ(expected, got);
    // The last session unloaded the module.
    const std::vector<std::string> lines = record();
    EXPECT_NE(lines.end(), std::find(lines.begin(), lines.end(), "RecordingPlugin: JexPlugin_unloaded"));
    EXPECT_TRUE(messages().empty());
}

} // namespace
