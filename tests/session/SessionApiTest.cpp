// SPDX-License-Identifier: MIT
// Sessions through the exported C functions, as a host sees them.

#include <gtest/gtest.h>

#include <cstring>
#include <string>
#include <utility>
#include <vector>

#include "jexjtag/jexjtag.h"
#include "support/TestSupport.hpp"

using testsupport::IsolatedEnvironment;
using testsupport::LogCapture;

namespace {

struct Received {
    unsigned handle;
    unsigned type;
    std::string text;
};
std::vector<Received> g_received;

void recordMessage(unsigned handle, unsigned type, const char* text) { g_received.push_back({handle, type, text}); }

class SessionApiTest : public ::testing::Test {
protected:
    void SetUp() override { g_received.clear(); }
    // Sessions are process-wide: none outlives its test.
    void TearDown() override
    {
        for (unsigned id = 0; id < 256; ++id) JexJtag_session_destroy(id << 16);
    }
    unsigned create(JexMessageCallback cb = nullptr, std::vector<const char*> args = {})
    {
        unsigned handle = 0xDEADBEEF;
        EXPECT_EQ(JEX_SUCCESS, JexJtag_session_create(cb, static_cast<unsigned>(args.size()),
                                                      args.empty() ? nullptr : args.data(), &handle));
        return handle;
    }
    IsolatedEnvironment env;
};

TEST_F(SessionApiTest, HandlesAreHandedOutInOrderAndMaskedOnLookup)
{
    // Bad arguments fail cleanly and do not advance the id counter.
    EXPECT_EQ(JEX_FAILURE, JexJtag_session_create(nullptr, 0, nullptr, nullptr));
    unsigned handle = 7;
    EXPECT_EQ(JEX_FAILURE, JexJtag_session_create(nullptr, 2, nullptr, &handle));
    EXPECT_EQ(0u, handle);
    const char* withNull[] = {"a=b", nullptr};
    handle = 7;
    EXPECT_EQ(JEX_FAILURE, JexJtag_session_create(nullptr, 2, withNull, &handle));
    EXPECT_EQ(0u, handle);

    const unsigned first = create(recordMessage);
    const unsigned second = create(recordMessage);
    EXPECT_EQ((first + 0x00010000u) & 0x00FF0000u, second);

    // Bits 24..31 and 8..15 are ignored; the callback sees the session's own handle.
    EXPECT_EQ(JEX_SUCCESS, JexJtag_session_sendMessage(first | 0xAB00CD00u, JEX_MSG_INFO, "hello"));
    // The low byte selects a target, not the session: the session is still reached.
    EXPECT_EQ(JEX_SUCCESS, JexJtag_session_sendMessage(second | 0x01u, JEX_MSG_INFO, "again"));
    ASSERT_EQ(2u, g_received.size());
    EXPECT_EQ(first, g_received[0].handle);
    EXPECT_EQ(second, g_received[1].handle);

    EXPECT_EQ(JEX_SUCCESS, JexJtag_session_destroy(first));
    EXPECT_EQ(JEX_FAILURE, JexJtag_session_destroy(first));
    EXPECT_EQ(JEX_FAILURE, JexJtag_session_sendMessage(first, JEX_MSG_INFO, "gone"));
    EXPECT_EQ(JEX_SUCCESS, JexJtag_session_destroy(second | 0xFF000000u));
}

TEST_F(SessionApiTest, IdsWrapAfter256AndSkipLiveSessions)
{
    // Ids go up by one from wherever the counter stands, and wrap to 0.
    unsigned h = create();
    for (unsigned n = 0; h != 0 && n < 256; ++n) {
        ASSERT_EQ(JEX_SUCCESS, JexJtag_session_destroy(h));
        const unsigned next = create();
        ASSERT_EQ((h + 0x00010000u) & 0x00FF0000u, next);
        h = next;
    }
    EXPECT_EQ(0u, h); // handle 0 is a valid handle
    EXPECT_EQ(JEX_SUCCESS, JexJtag_session_sendMessage(0, JEX_MSG_SILENT, "x"));
    const unsigned keep = create(); // the 257th: 0x00010000 again
    EXPECT_EQ(0x00010000u, keep);
    EXPECT_EQ(JEX_SUCCESS, JexJtag_session_destroy(0));

    // Walk the counter round once more while 0x00010000 stays live: its id is skipped.
    for (unsigned i = 2; i < 256; ++i) ASSERT_EQ(JEX_SUCCESS, JexJtag_session_destroy(create()));
    ASSERT_EQ(JEX_SUCCESS, JexJtag_session_destroy(create())); // id 0
    EXPECT_EQ(0x00020000u, create());
}

TEST_F(SessionApiTest, CreationFailsOnlyWhenAllIdsAreLive)
{
    std::vector<unsigned> handles;
    for (unsigned i = 0; i < 256; ++i) handles.push_back(create());
    unsigned handle = 0x1234;
    EXPECT_EQ(JEX_FAILURE, JexJtag_session_create(nullptr, 0, nullptr, &handle));
    EXPECT_EQ(0u, handle);
    EXPECT_EQ(JEX_SUCCESS, JexJtag_session_destroy(handles[7]));
    EXPECT_EQ(handles[7], create());
}

TEST_F(SessionApiTest, ApiVersionRules)
{
    LogCapture log(1);
    unsigned version = 0;
    char text[200];
    std::memset(text, 'z', sizeof text);
    EXPECT_EQ(JEX_FAILURE, JexJtag_session_getAPIVersion(&version, text, 127));
    EXPECT_TRUE(log.has("JexJtag_session_getAPIVersion() -  versionLen is too small\n"));
    EXPECT_NE(0u, version); // written before the length check
    EXPECT_EQ('z', text[0]);
    version = 0;
    EXPECT_EQ(JEX_SUCCESS, JexJtag_session_getAPIVersion(&version, nullptr, 128));
    EXPECT_NE(0u, version);
    EXPECT_EQ(JEX_SUCCESS, JexJtag_session_getAPIVersion(nullptr, text, 128));
    EXPECT_EQ(0, std::strncmp(text, "Version ", 8));
    EXPECT_EQ('\0', text[127]);
    EXPECT_EQ('z', text[128]); // only 128 bytes are touched
}

TEST_F(SessionApiTest, PluginSearchPathBufferRule)
{
    const unsigned h = create();
    const std::string path = "/opt/cables";
    EXPECT_EQ(JEX_SUCCESS, JexJtag_session_setPluginSearchPath(h, path.c_str()));
    char buf[64];
    std::memset(buf, 'q', sizeof buf);
    EXPECT_EQ(JEX_FAILURE, JexJtag_session_getPluginSearchPath(h, buf, static_cast<unsigned>(path.size())));
    EXPECT_EQ('q', buf[0]);
    EXPECT_EQ(JEX_SUCCESS, JexJtag_session_getPluginSearchPath(h, buf, static_cast<unsigned>(path.size() + 1)));
    EXPECT_EQ(path, std::string(buf));
    EXPECT_EQ(JEX_FAILURE, JexJtag_session_getPluginSearchPath(h, nullptr, 100));
    EXPECT_EQ(JEX_FAILURE, JexJtag_session_setPluginSearchPath(h, nullptr));
    EXPECT_EQ(JEX_FAILURE, JexJtag_session_setPluginSearchPath(0x00770000, "/x"));
}

// An empty target list and refreshing it are covered by SessionTargetListTest.
TEST_F(SessionApiTest, TargetListNullOutputsAndUnknownHandle)
{
    const unsigned h = create();
    EXPECT_EQ(JEX_FAILURE, JexJtag_session_getTargetCount(h, nullptr));
    EXPECT_EQ(JEX_FAILURE, JexJtag_session_getTargetXMLSizeByIndex(h, 0, nullptr));
    char xml[16], name[16], plugin[16];
    EXPECT_EQ(JEX_FAILURE, JexJtag_session_getTargetByIndex(h, 0, xml, sizeof xml, name, sizeof name, plugin,
                                                            sizeof plugin));
    EXPECT_EQ(JEX_FAILURE, JexJtag_session_refreshTargetList(h + 0x00010000));
}

TEST_F(SessionApiTest, MessagesWithoutCallbackArePrintedWithTheirPrefix)
{
    const unsigned h = create();
    ::testing::internal::CaptureStdout();
    for (const auto& [type, text] : {std::pair<unsigned, const char*> {JEX_MSG_ERROR, "bad cable\n"},
                                     {JEX_MSG_WARNING, "w"}, {JEX_MSG_STATUS, "s"}, {JEX_MSG_INFO, "i"},
                                     {JEX_MSG_NOISE, "n"}, {7u, "d"}, {JEX_MSG_SILENT, "never shown"}})
        JexJtag_session_sendMessage(h, type, text);
    EXPECT_EQ("Error:bad cable\nWarning:wStatus:sInfo:ind", ::testing::internal::GetCapturedStdout());
}

TEST_F(SessionApiTest, EveryTypeReachesTheCallbackUnchanged)
{
    const unsigned h = create(recordMessage);
    ::testing::internal::CaptureStdout();
    for (unsigned type : {JEX_MSG_ERROR, JEX_MSG_WARNING, JEX_MSG_STATUS, JEX_MSG_INFO, JEX_MSG_NOISE,
                          JEX_MSG_SILENT, 7u, 0x12345u})
        EXPECT_EQ(JEX_SUCCESS, JexJtag_session_sendMessage(h, type, "t"));
    EXPECT_EQ("", ::testing::internal::GetCapturedStdout());
    ASSERT_EQ(8u, g_received.size());
    EXPECT_EQ(JEX_MSG_SILENT, g_received[5].type);
    EXPECT_EQ(0x12345u, g_received[7].type);
    EXPECT_EQ(JEX_FAILURE, JexJtag_session_sendMessage(h, JEX_MSG_INFO, nullptr));
}

TEST_F(SessionApiTest, LoggingOffWritesNothing)
{
    testsupport::TempDir dir;
    testsupport::ScopedEnv file("JEXJTAG_LOG_FILE", (dir / "log.txt").string());
    testsupport::ScopedEnv level("JEXJTAG_LOG_LEVEL", "0");
    const unsigned h = create();
    JexJtag_session_sendMessage(h, JEX_MSG_ERROR, "e");
    JexJtag_session_destroy(h);
    EXPECT_EQ("", testsupport::readFile(dir / "log.txt"));
}

} // namespace
