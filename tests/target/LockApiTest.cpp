// SPDX-License-Identifier: MIT
// The cross-process target lock: the exported lock functions, the scoped
// JexJtagTargetLock, and cleaning stale locks.

#include <gtest/gtest.h>

#include <type_traits>

#include <string>
#include <vector>

#include "RecordingFixture.hpp"
#include "jexjtag/JexRT.hpp"

using namespace targettest;
using testsupport::LogCapture;

namespace {

// Only the object that took a lock releases it: no copies.
static_assert(!std::is_copy_constructible_v<JexRT::JexJtagTargetLock> &&
              !std::is_copy_assignable_v<JexRT::JexJtagTargetLock>);

using LockApiTest = RecordingFixture;

TEST_F(LockApiTest, LockTwiceThenUnlock)
{
    const unsigned h = openTarget();
    unsigned status = 0;
    EXPECT_EQ(JEX_SUCCESS, JexJtag_target_lock(h, 500, &status));
    EXPECT_EQ(unsigned{JEXJTAG_LOCKED_ME}, status);
    status = 0;
    // Held already: refused without asking the plug-in, status still "mine".
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_lock(h, 500, &status));
    EXPECT_EQ(unsigned{JEXJTAG_LOCKED_ME}, status);
    EXPECT_EQ(JEX_SUCCESS, JexJtag_target_unlock(h));
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_unlock(h)); // not held: the plug-in is not asked
    EXPECT_EQ(JEX_SUCCESS, JexJtag_target_getLockStatus(h, &status));
    EXPECT_EQ(unsigned{JEXJTAG_UNLOCKED}, status);

    EXPECT_EQ((std::vector<std::string>{"lockTarget msWait=500", "unlockTarget"}), calls());
    const std::string hs = std::to_string(h);
}

TEST_F(LockApiTest, ClosingALockedTargetDoesNotUnlockIt)
{
    const unsigned h = openTarget();
    unsigned status = 0;
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_lock(h, 1, &status));
    clearRecord();
    LogCapture log(1);
    EXPECT_EQ(JEX_SUCCESS, JexJtag_target_close(h));
    const std::vector<std::string> got = calls();
    ASSERT_EQ(2u, got.size());
    EXPECT_EQ("closeTarget", got[0]);
    EXPECT_EQ(0u, got[1].find("JexPlugin_destroy"));
    // The target object still held the lock flag and tried to unlock a closed instance.
    EXPECT_TRUE(log.has("m_plugin is NULL!\n"));
}

TEST_F(LockApiTest, RefusedLocksLeaveTheTargetUnlockedAndNoTargetThrows)
{
    const unsigned h = createSession();
    try {
        JexRT::JexJtagTargetLock lock(h, 1);
        FAIL() << "no exception";
    } catch (const JexRT::Jex_AbortException& e) {
        EXPECT_STREQ("Jex abort command", e.what());
    }
    // A lock the plug-in refuses is no exception: the object just holds nothing.
    ASSERT_EQ(JEX_SUCCESS, open("recording", {"fail=lockTarget"}));
    clearRecord();
    {
        JexRT::JexJtagTargetLock refused(h, 5);
        EXPECT_FALSE(refused.holdsLock());
    }
    unsigned status = 0;
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_lock(h, 20, &status));
    EXPECT_EQ(unsigned{JEXJTAG_UNLOCKED}, status);
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_lock(h, 20, nullptr));
    EXPECT_EQ((std::vector<std::string>{"lockTarget msWait=5", "lockTarget msWait=20"}), calls());
}

TEST_F(LockApiTest, CleanLocksUsesATemporaryUsbCableInstanceAndRefusesWhileATargetIsOpen)
{
    const unsigned h = createSession();
    EXPECT_EQ(JEX_SUCCESS, JexJtag_target_cleanLocks(h));
    const std::vector<std::string> got = calls();
    ASSERT_EQ(4u, got.size());
    EXPECT_EQ("JexPlugin_create", got[0]);
    EXPECT_EQ("setSessionHandle handle=" + std::to_string(h), got[1]);
    EXPECT_EQ("cleanLocks sessionHandle=" + std::to_string(h), got[2]);
    EXPECT_EQ(0u, got[3].find("JexPlugin_destroy"));
    // The temporary target object is gone again: a target opens as usual.
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_close(h));
    EXPECT_EQ(JEX_SUCCESS, open("recording"));
    clearRecord();

    // With a target open the locks are left alone, and so is the target.
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_cleanLocks(h));
    ASSERT_EQ(1u, messages().size());
    EXPECT_EQ(JEX_MSG_ERROR, messages()[0].type);
    EXPECT_EQ("The locks cannot be cleaned while a target is Open.", messages()[0].text);
    EXPECT_TRUE(calls().empty());
    EXPECT_EQ(JEX_SUCCESS, JexJtag_target_flush(h)); // the open target is untouched
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_cleanLocks(h | 1u));
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_cleanLocks(h + 0x00010000u));
}

TEST_F(LockApiTest, CleanLocksFailsWhenNoPluginServesTheUsbCable)
{
    removeModule("RecordingPlugin");
    const unsigned h = createSession();
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_cleanLocks(h));
    for (const std::string& line : record()) EXPECT_EQ(std::string::npos, line.find("JexPlugin_create"));
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_close(h)); // no target object stays behind
}

} // namespace
