// The target classes from inside the library: a Target without
// implementation and an implementation without plug-in instance fail
// every call instead of following a null pointer.

#include <gtest/gtest.h>

#include <cstring>
#include <string>

#include "jexjtag/rt/IDCode.hpp"
#include "session/Session.hpp"
#include "session/SessionRegistry.hpp"
#include "support/TestSupport.hpp"
#include "target/Target.hpp"
#include "target/Vivedoru10TargetImpl.hpp"

using testsupport::LogCapture;

namespace {

class TargetInternalTest : public ::testing::Test {
protected:
    void SetUp() override { ASSERT_EQ(JEX_SUCCESS, JexRT::createSession(nullptr, 0, nullptr, &m_handle)); }
    void TearDown() override { JexRT::destroySession(m_handle); }
    JexRT::Session* session() const { return JexRT::findSession(m_handle); }

    testsupport::IsolatedEnvironment m_env;
    unsigned m_handle = 0;
};

TEST_F(TargetInternalTest, ATargetWithoutImplementationFailsEverything)
{
    JexRT::Target* t = session()->createTarget(0);
    ASSERT_NE(nullptr, t);
    t->release();
    EXPECT_EQ(nullptr, t->getSession());
    unsigned value = 7;
    std::string text;
    JexRT::IDCode idcode(0xFFFFFFFFu);
    JexJtagTargetInfo info{};
    EXPECT_EQ(JEX_FAILURE, t->open("recording", nullptr, {}));
    EXPECT_EQ(JEX_FAILURE, t->close());
    EXPECT_EQ(JEX_FAILURE, t->lock(1));
    EXPECT_EQ(JEX_FAILURE, t->unlock());
    EXPECT_EQ(unsigned{JEXJTAG_NOTARGET}, t->getLockStatus());
    EXPECT_EQ(JEX_FAILURE, t->getInfo(&info));
    EXPECT_EQ(JEX_FAILURE, t->getDeviceCount(&value));
    EXPECT_EQ(0u, value);
    value = 7;
    EXPECT_EQ(JEX_FAILURE, t->getIRLength(0, &value));
    EXPECT_EQ(0u, value);
    EXPECT_EQ(JEX_FAILURE, t->getDeviceIdcode(0, idcode));
    EXPECT_EQ(std::string(32, '0'), idcode.getIDCode());
    EXPECT_EQ(JEX_FAILURE, t->getOption("k", text, &value));
    EXPECT_EQ(JEX_FAILURE, t->cleanLocks("ormund_usbcable"));
    EXPECT_EQ(JEX_FAILURE, t->navigate(0, 0, 0));
    EXPECT_EQ(JEX_FAILURE, t->shiftChainDR(nullptr, nullptr, 8, nullptr, nullptr, 3, 1, nullptr));
    EXPECT_FALSE(t->isOpen());
    session()->destroyTarget(0);
}

TEST_F(TargetInternalTest, AnImplementationWithoutInstanceSaysSo)
{
    JexRT::Vivedoru10TargetImpl impl(session());
    LogCapture log(1);
    JexJtagTargetInfo info;
    std::memset(&info, 0xAB, sizeof info);
    EXPECT_EQ(JEX_FAILURE, impl.getInfo(&info));
    const JexJtagTargetInfo zero{};
    EXPECT_EQ(0, std::memcmp(&zero, &info, sizeof info)); // cleared although nothing answered
    unsigned count = 9;
    EXPECT_EQ(JEX_FAILURE, impl.getDeviceCount(&count));
    EXPECT_EQ(0u, count);
    EXPECT_EQ(JEX_FAILURE, impl.close());
    EXPECT_EQ(JEX_FAILURE, impl.lock(1));
    EXPECT_EQ(JEX_FAILURE, impl.autodetect(0));
    EXPECT_EQ(JEX_FAILURE, impl.shiftDeviceIR(0, nullptr, nullptr, 8, nullptr, nullptr, 3, 1, nullptr));
    EXPECT_EQ(unsigned{JEXJTAG_UNLOCKED}, impl.getLockStatus());
    EXPECT_EQ(JEX_FAILURE, impl.setBypassCmd(0, "1"));
    std::string value = "untouched";
    unsigned size = 16;
    EXPECT_EQ(JEX_FAILURE, impl.getOption("key", value, &size));
    EXPECT_EQ("untouched", value);
    EXPECT_EQ(7u, log.count("m_plugin is NULL!\n"));
}

} // namespace
