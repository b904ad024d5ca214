// SPDX-License-Identifier: MIT
// A host callback that calls back in while a library or plug-in call is
// under way: destroying its session, closing its target, creating sessions.
// Run under ASan and valgrind; what matters is that nothing freed is used.

#include <gtest/gtest.h>

#include <cstdlib>
#include <functional>
#include <string>

#include "RecordingFixture.hpp"

namespace {

using namespace targettest;

unsigned g_handle = 0;
std::function<void()> g_onWarning;

void callBackIn(unsigned handle, unsigned type, const char* text)
{
    keepMessage(handle, type, text);
    if (type != JEX_MSG_WARNING || !g_onWarning) return;
    std::function<void()> action = std::move(g_onWarning); // once
    g_onWarning = nullptr;
    action();
}

class ReentrancyTest : public RecordingFixture {
protected:
    void TearDown() override
    {
        g_onWarning = nullptr;
        RecordingFixture::TearDown();
    }
    void openWith(const std::string& config, bool expectOpen = true)
    {
        configure(config);
        ASSERT_EQ(JEX_SUCCESS, JexJtag_session_create(callBackIn, 0, nullptr, &g_handle));
        m_handle = g_handle;
        if (expectOpen) {
            ASSERT_EQ(JEX_SUCCESS, open());
        }
    }
    // The session is gone: a later TearDown must not destroy a reused id.
    void expectSessionGone()
    {
        EXPECT_EQ(JEX_FAILURE, JexJtag_session_refreshTargetList(g_handle));
        m_handle = kNoSession;
    }
    bool recorded(const std::string& call) const
    {
        for (const std::string& line : record())
            if (line.find("RecordingPlugin: " + call) == 0) return true;
        return false;
    }
};

const auto destroySession = [] { EXPECT_EQ(JEX_SUCCESS, JexJtag_session_destroy(g_handle)); };
const auto closeTarget = [] { EXPECT_EQ(JEX_SUCCESS, JexJtag_target_close(g_handle)); };

TEST_F(ReentrancyTest, FailingOpenWhoseCallbackDestroysTheSession)
{
    openWith("say=openTarget;fail=openTarget", false);
    g_onWarning = destroySession;
    EXPECT_EQ(JEX_FAILURE, open());
    expectSessionGone();
    EXPECT_TRUE(recorded("JexPlugin_destroy"));
}

TEST_F(ReentrancyTest, TargetClosedFromItsOwnCalls)
{
    struct Case {
        const char* op;
        std::function<uint32_t()> call;
    };
    unsigned char tdi[4] = {1, 2, 3, 4}, tdo[4] = {};
    const Case cases[] = {
        {"openTarget", [] { return JexJtag_target_open(g_handle, "recording", nullptr, 0, nullptr, nullptr); }},
        {"shiftChainDRReadWrite",
         [&] { return JexJtag_tap_shiftChainDR(g_handle, JEXJTAG_SHIFT_READWRITE, JEXJTAG_RUN_TEST_IDLE, nullptr, 32,
                                               tdi, tdo, nullptr, nullptr); }},
        {"interrogate", [] { return JexJtag_tap_interrogateChain(g_handle, 0); }},
        {"lockTarget", [] {
             unsigned status = 0;
             return JexJtag_target_lock(g_handle, 0, &status);
         }},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.op);
        const bool opening = std::string(c.op) == "openTarget";
        openWith(std::string("devices=0362D093:6;say=") + c.op, !opening);
        clearRecord();
        g_onWarning = closeTarget;
        c.call();
        unsigned status = 0;
        EXPECT_EQ(JEX_FAILURE, JexJtag_target_getLockStatus(g_handle, &status)); // no target any more
        EXPECT_TRUE(recorded("closeTarget"));
        EXPECT_TRUE(recorded("JexPlugin_destroy"));
        EXPECT_EQ(JEX_SUCCESS, JexJtag_session_destroy(g_handle));
        m_handle = kNoSession;
    }
}

TEST_F(ReentrancyTest, LastSessionDestroyedDuringAutodetectAndLock)
{
    for (const char* op : {"interrogate", "lockTarget"}) {
        SCOPED_TRACE(op);
        openWith(std::string("devices=0362D093:6;say=") + op);
        g_onWarning = [] {
            unsigned other = 0; // a session created and destroyed meanwhile
            EXPECT_EQ(JEX_SUCCESS, JexJtag_session_create(nullptr, 0, nullptr, &other));
            EXPECT_EQ(JEX_SUCCESS, JexJtag_session_destroy(other));
            destroySession();
        };
        unsigned status = 0;
        if (std::string(op) == "interrogate") JexJtag_tap_autodetectChain(g_handle, 0);
        else JexJtag_target_lock(g_handle, 0, &status);
        expectSessionGone();
        EXPECT_TRUE(recorded("JexPlugin_unloaded")); // the module went once the call was over
    }
}

TEST_F(ReentrancyTest, SessionDestroyedByABsdlWarning)
{
    openWith("", false);
    g_onWarning = destroySession;
    const std::string text = "junk line\nentity T is\n attribute INSTRUCTION_LENGTH of T : entity is 2;\n"
                             " attribute INSTRUCTION_OPCODE of T : entity is \"BYPASS (11)\";\nend T;\n";
    char name[32], idcode[40], bypass[8];
    unsigned irlength = 0;
    EXPECT_EQ(JEX_SUCCESS, JexJtag_db_parseBSDL(g_handle, "t.bsd", text.data(), static_cast<unsigned>(text.size()),
                                                name, sizeof name, &irlength, idcode, sizeof idcode, bypass,
                                                sizeof bypass));
    EXPECT_EQ(2u, irlength);
    expectSessionGone();
}

// An instance goes back to the module that created it, even when a later
// discovery made another module serve its type.
TEST_F(ReentrancyTest, InstanceGoesBackToItsOwnModule)
{
    removeModule("RecordingPluginB");
    openWith("");
    installModule("RecordingPluginB");
    testsupport::writeFile(m_env.pluginRoot() / "JexTests/RecordingPluginB/RecordingPluginB.xml",
                           "<JexPlugin><targetname>recording</targetname></JexPlugin>");
    EXPECT_EQ(JEX_SUCCESS, JexJtag_session_refreshTargetList(g_handle));
    clearRecord();
    EXPECT_EQ(JEX_SUCCESS, JexJtag_target_close(g_handle));
    const std::vector<std::string> lines = record();
    ASSERT_FALSE(lines.empty());
    EXPECT_EQ(0u, lines.back().rfind("RecordingPlugin: JexPlugin_destroy", 0)) << lines.back();
}

// Sessions destroyed from an atexit handler, after the library's statics
// would have been destroyed.
unsigned g_exitHandle = 0;
void destroyAtExit()
{
    if (JEX_FAILED(JexJtag_session_destroy(g_exitHandle))) std::_Exit(3);
}

TEST_F(ReentrancyTest, SessionDestroyedAtExit)
{
    EXPECT_EXIT(
        {
            std::atexit(destroyAtExit);
            openWith("");
            g_exitHandle = g_handle;
            std::exit(0);
        },
        ::testing::ExitedWithCode(0), "");
}

} // namespace
