// SPDX-License-Identifier: MIT
// Opening, closing, commanding and querying a target through the exported
// functions, checked against what reached the recording plug-in.

#include <gtest/gtest.h>

#include <cstring>
#include <string>
#include <vector>

#include "RecordingFixture.hpp"

using namespace targettest;
using testsupport::LogCapture;

namespace {

using TargetApiTest = RecordingFixture;

const char* const kAlreadyOpen = "There is already a target opened for this session.  Close the target first or "
                                 "create a new session to open a new target.\n";

TEST_F(TargetApiTest, OpenHandsThePluginTheSessionArgumentsTypeAndContext)
{
    const unsigned h = createSession();
    JexJtagTargetInfo info;
    std::memset(&info, 0xEE, sizeof info);
    void* const callerData = reinterpret_cast<void*>(0x1234);
    ASSERT_EQ(JEX_SUCCESS, open("recording", {"speed=5", "port=usb"}, &info, callerData));

    const std::vector<std::string> expected = {
        "JexPlugin_create",
        "setSessionHandle handle=" + std::to_string(h),
        "openTarget argc=3 argv=[speed=5|port=usb|type=recording] handle=" + std::to_string(h) +
            " callerData=0x1234",
    };
    const std::vector<std::string> got = calls();
    ASSERT_GE(got.size(), 4u);
    EXPECT_EQ(expected, std::vector<std::string>(got.begin(), got.begin() + 3));
    // The record handed to the plug-in was cleared first; the host gets the plug-in's answers.
    EXPECT_EQ(0u, got[3].find("getTargetInfo info=0x"));
    EXPECT_NE(std::string::npos, got[3].find("zeroed=1"));
    EXPECT_STREQ("recording", info.target_name);
    EXPECT_STREQ("RecordingPlugin", info.plugin_name);
    EXPECT_STREQ("UID-42", info.target_uid);
    EXPECT_EQ(0u, info.target_flags);

    // A null info is allowed; the target is then simply open.
    EXPECT_EQ(JEX_SUCCESS, JexJtag_target_close(h));
    EXPECT_EQ(JEX_SUCCESS, open("recording", {}, nullptr));
    EXPECT_EQ(JEX_SUCCESS, JexJtag_target_flush(h));
}

TEST_F(TargetApiTest, CloseGivesTheInstanceBackWhateverThePluginAnswers)
{
    configure("fail=closeTarget");
    const unsigned h = openTarget();
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_close(h));
    const std::vector<std::string> got = calls();
    ASSERT_EQ(2u, got.size());
    EXPECT_EQ("closeTarget", got[0]);
    EXPECT_EQ(0u, got[1].find("JexPlugin_destroy instance=0x"));
    // The target object is gone: a second close reaches nothing.
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_close(h));
    EXPECT_EQ(2u, calls().size());
}

TEST_F(TargetApiTest, SecondOpenFailsAndClosesTheFirstTarget)
{
    const unsigned h = createSession();
    ASSERT_EQ(JEX_SUCCESS, open("recording"));
    clearRecord();
    LogCapture log(1);

    // The second type lives in another module: its instance is never made,
    // and the first one goes back to the module that made it.
    EXPECT_EQ(JEX_FAILURE, open("recording_b"));
    const std::vector<std::string> got = calls();
    ASSERT_EQ(2u, got.size());
    EXPECT_EQ("closeTarget", got[0]);
    EXPECT_EQ(0u, got[1].find("JexPlugin_destroy"));
    for (const std::string& line : record()) EXPECT_EQ(std::string::npos, line.find("RecordingPluginB: JexPlugin_create"));

    ASSERT_EQ(1u, messages().size());
    EXPECT_EQ(h, messages()[0].handle);
    EXPECT_EQ(JEX_MSG_ERROR, messages()[0].type);
    EXPECT_EQ(kAlreadyOpen, messages()[0].text);
    EXPECT_TRUE(log.has(kAlreadyOpen));

    EXPECT_EQ(JEX_FAILURE, JexJtag_target_close(h));
    EXPECT_EQ(JEX_SUCCESS, open("recording_b"));
}

TEST_F(TargetApiTest, FailedOpenDestroysTheInstanceAndLeavesNoTarget)
{
    configure("fail=openTarget");
    const unsigned h = createSession();
    EXPECT_EQ(JEX_FAILURE, open("recording"));
    const std::vector<std::string> got = calls();
    ASSERT_EQ(4u, got.size());
    EXPECT_EQ("JexPlugin_create", got[0]);
    EXPECT_EQ(0u, got[2].find("openTarget argc=1 argv=[type=recording]"));
    EXPECT_EQ(0u, got[3].find("JexPlugin_destroy"));
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_close(h));
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_flush(h));
}

TEST_F(TargetApiTest, OpenWithoutAnInstanceReportsToTheHost)
{
    const unsigned h = createSession();
    const std::string noPlugin = "Could not open plugin of the type: nosuchcable. Please check to make sure the "
                                 "correct plug-in for this type is installed.\n";
    EXPECT_EQ(JEX_FAILURE, open("nosuchcable"));
    EXPECT_EQ(JEX_FAILURE, open(""));
    configure("create=null");
    EXPECT_EQ(JEX_FAILURE, open("recording"));

    ASSERT_EQ(3u, messages().size());
    EXPECT_EQ(noPlugin, messages()[0].text);
    EXPECT_EQ("No valid targetName provided!\n", messages()[1].text);
    EXPECT_EQ(0u, messages()[2].text.find("Could not open plugin of the type: recording."));
    for (const Message& m : messages()) EXPECT_EQ(JEX_MSG_ERROR, m.type);
    // A null instance from the module is never given back.
    const std::vector<std::string> got = calls();
    ASSERT_EQ(1u, got.size());
    EXPECT_EQ("JexPlugin_create", got[0]);
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_close(h));
}

TEST_F(TargetApiTest, OpenRefusesHandlesThatReachNoTargetSlot)
{
    const unsigned h = createSession();
    const char* args[] = {"a=1"};
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_open(h | 1u, "recording", nullptr, 0, nullptr, nullptr));
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_open(h + 0x00010000u, "recording", nullptr, 0, nullptr, nullptr));
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_open(h, nullptr, nullptr, 0, nullptr, nullptr));
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_open(h, "recording", nullptr, 1, nullptr, nullptr));
    const char* withNull[] = {"a=1", nullptr};
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_open(h, "recording", nullptr, 2, withNull, nullptr));
    EXPECT_TRUE(calls().empty());
    // Bits outside the session id and target index are ignored.
    EXPECT_EQ(JEX_SUCCESS, JexJtag_target_open(h | 0xAB00CD00u, "recording", nullptr, 1, args, nullptr));
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_flush(h | 1u));
    EXPECT_EQ(JEX_SUCCESS, JexJtag_target_close(h));
}

TEST_F(TargetApiTest, AvoidFirmwareUpdateClosesATargetWithNewFirmware)
{
    const unsigned h = createSession();
    configure("flags=0x11");
    {
        LogCapture log(3);
        JexJtagTargetInfo info{};
        EXPECT_EQ(JEX_SUCCESS, open("recording", {"AVOID_FIRMWARE_UPDATE=TrUe"}, &info));
        EXPECT_EQ(0x11u, info.target_flags);
        EXPECT_STREQ("recording", info.target_name);
        EXPECT_TRUE(log.has("JexJtag_target_open() -- Closing target because AVOID_FIRMWARE_UPDATE=TRUE is set and "
                            "new firmware is available.\n"));
    }
    const std::vector<std::string> got = calls();
    ASSERT_GE(got.size(), 2u);
    EXPECT_EQ("closeTarget", got[got.size() - 2]);
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_close(h));
}

TEST_F(TargetApiTest, OptionsTravelAsGetAndSetCommands)
{
    const unsigned h = openTarget({"option.speed=fast"});
    EXPECT_EQ(JEX_SUCCESS, JexJtag_target_setOption(h, "clock", "7"));
    char value[64];
    std::memset(value, 'x', sizeof value);
    unsigned size = sizeof value;
    EXPECT_EQ(JEX_SUCCESS, JexJtag_target_getOption(h, "clock", value, &size));
    EXPECT_STREQ("7", value);
    EXPECT_EQ(1u, size);

    const std::vector<std::string> got = calls();
    ASSERT_EQ(2u, got.size());
    // Five characters, '=', one character and the NUL; no reply buffer; an empty context.
    EXPECT_EQ("sendCommand command=set in=clock=7 inLength=8 out=null outLength=null handle=0 callerData=null",
              got[0]);
    EXPECT_EQ(0u, got[1].find("sendCommand command=get in=clock inLength=6 out=0x"));
    EXPECT_NE(std::string::npos, got[1].find(" outLength=64 handle=0 callerData=null"));
}

TEST_F(TargetApiTest, GetOptionStaysWithinTheCallersCapacity)
{
    // What the plug-in leaves in the length word: the length of the text it
    // wrote, the option's full length, or the capacity untouched.  A cut text
    // is capacity - 1 characters and a NUL; nothing is written past the
    // capacity, and the word tells the caller whether to retry larger.
    struct Case {
        const char* optlen;
        const char* value;
        unsigned capacity;
        const char* text;
        unsigned size;
    };
    const Case cases[] = {
        {"text", "abcdef", 7, "abcdef", 6},        {"text", "abcdef", 4, "abc", 3},
        {"full", "abcdefghijkl", 4, "abc", 12},    {"full", "abcdefghijkl", 13, "abcdefghijkl", 12},
        {"keep", "abcdefghijkl", 5, "abcd", 5},    {"keep", "abcdefghijkl", 64, "abcdefghijkl", 12},
    };
    const unsigned h = createSession();
    for (const Case& c : cases) {
        SCOPED_TRACE(std::string(c.optlen) + " " + std::to_string(c.capacity));
        const std::string option = std::string("option.name=") + c.value, optlen = std::string("optlen=") + c.optlen;
        ASSERT_EQ(JEX_SUCCESS, open("recording", {option.c_str(), optlen.c_str()}));
        char value[80];
        std::memset(value, 'x', sizeof value);
        unsigned size = c.capacity;
        EXPECT_EQ(JEX_SUCCESS, JexJtag_target_getOption(h, "name", value, &size));
        EXPECT_STREQ(c.text, value);
        EXPECT_EQ(c.size, size);
        EXPECT_EQ(std::string(sizeof value - c.capacity, 'x'), std::string(value + c.capacity, sizeof value - c.capacity));
        JexJtag_target_close(h);
    }
}

TEST_F(TargetApiTest, GetOptionRefusesMissingBuffersAndKeepsValueOnFailure)
{
    const unsigned h = openTarget({"option.name=abc"});
    char value[8] = "keep";
    unsigned size = 0;
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_getOption(h, "name", value, &size));
    size = sizeof value;
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_getOption(h, "name", nullptr, &size));
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_getOption(h, "name", value, nullptr));
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_getOption(h, nullptr, value, &size));
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_setOption(h, "name", nullptr));
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_setOption(h, nullptr, "x"));
    EXPECT_TRUE(calls().empty());
    // An option the plug-in does not know: its failure, value untouched.
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_getOption(h, "other", value, &size));
    EXPECT_STREQ("keep", value);
}

TEST_F(TargetApiTest, SendCommandPassesBuffersAndContextThrough)
{
    const unsigned h = openTarget({"cmdout=pong"});
    const unsigned char in[3] = {1, 2, 3};
    unsigned char out[16] = {};
    unsigned outLen = sizeof out;
    void* const callerData = reinterpret_cast<void*>(0xBEEF);
    EXPECT_EQ(JEX_SUCCESS, JexJtag_target_sendCommand(h, "reset", in, 3, out, &outLen, callerData));
    EXPECT_STREQ("pong", reinterpret_cast<char*>(out));
    EXPECT_EQ(4u, outLen);
    const std::vector<std::string> got = calls();
    ASSERT_EQ(1u, got.size());
    EXPECT_EQ("sendCommand command=reset in=\x01\x02\x03 inLength=3 out=" + pointerText(out) + " outLength=16 handle=" +
                  std::to_string(h) + " callerData=0xbeef",
              got[0]);

    // "get" and "set" in any case show their text; it is read no further than inbuflen.
    const char key[] = {'n', 'a', 'm', 'e', 'X', 'Y'};
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_sendCommand(h, "GeT", reinterpret_cast<const unsigned char*>(key), 4,
                                                      nullptr, nullptr, nullptr));
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_sendCommand(h, nullptr, in, 3, out, &outLen, nullptr));
}

TEST_F(TargetApiTest, PinsWaitingAndFlushReachThePlugin)
{
    const unsigned h = openTarget({"pin=1"});
    unsigned value = 99;
    EXPECT_EQ(JEX_SUCCESS, JexJtag_target_setPin(h, JEXJTAG_TMS, 1));
    EXPECT_EQ(JEX_SUCCESS, JexJtag_target_getPin(h, JEXJTAG_TDO, &value));
    EXPECT_EQ(1u, value);
    EXPECT_EQ(JEX_SUCCESS, JexJtag_target_pulsePin(h, 7, 12));
    EXPECT_EQ(JEX_SUCCESS, JexJtag_target_waitTime(h, 250));
    EXPECT_EQ(JEX_SUCCESS, JexJtag_target_flush(h));
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_getPin(h, JEXJTAG_TDO, nullptr));
    EXPECT_EQ(5u, calls().size()) << "the null value pointer never reaches the plug-in";

    // The pins' effect is checked end to end (E2eChainTest walks the TAP by pin).
    const std::string hs = std::to_string(h);
}

TEST_F(TargetApiTest, GetInfoCopiesTheRecordAndRefusesANullOne)
{
    const unsigned h = openTarget({"flags=0x6"});
    LogCapture log(3);
    JexJtagTargetInfo info;
    EXPECT_EQ(JEX_SUCCESS, JexJtag_target_getInfo(h, &info));
    EXPECT_STREQ("Test Vendor", info.vendor);
    EXPECT_EQ(6u, info.target_flags);
    EXPECT_TRUE(log.has("    target_flags=0x6\n"));
    // A null record fails although the plug-in answered.
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_getInfo(h, nullptr));
    EXPECT_EQ(2u, calls().size());
}

TEST_F(TargetApiTest, EveryTargetAndLockFunctionFailsWithoutATarget)
{
    const unsigned h = createSession();
    unsigned value = 77;
    unsigned size = 8;
    char text[8] = "keep";
    JexJtagTargetInfo info{};
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_close(h));
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_sendCommand(h, "x", nullptr, 0, nullptr, nullptr, nullptr));
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_setOption(h, "a", "b"));
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_getOption(h, "a", text, &size));
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_flush(h));
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_setPin(h, 0, 1));
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_getPin(h, 0, &value));
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_pulsePin(h, 0, 1));
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_waitTime(h, 1));
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_getInfo(h, &info));
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_getLockStatus(h, &value));
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_lock(h, 1, &value));
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_unlock(h));
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_getLockStatus(h, nullptr));
    EXPECT_EQ(77u, value);
    EXPECT_EQ(8u, size);
    EXPECT_STREQ("keep", text);
    EXPECT_TRUE(calls().empty());
}

} // namespace
