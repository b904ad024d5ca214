// SPDX-License-Identifier: MIT
// The registry's listeners and the message path from the host layer, seen
// from inside the library.

#include <gtest/gtest.h>

#include <string>
#include <utility>
#include <vector>

#include "hostlayer/Port_MsgDispatcher.hpp"
#include "jexjtag/JexRT.hpp"
#include "session/PortabilityMessageInterceptor.hpp"
#include "session/Session.hpp"
#include "session/SessionRegistry.hpp"
#include "support/TestSupport.hpp"
#include "util/Version.hpp"

namespace {

using Event = std::pair<std::string, unsigned>;

class RecordingListener : public JexRT::SessionMessageListener {
public:
    RecordingListener(std::vector<Event>& log, std::string name) : m_log(log), m_name(std::move(name)) {}
    void sessionCreated(unsigned handle) override { m_log.emplace_back(m_name + " created", handle); }
    void sessionDestroyed(unsigned handle) override { m_log.emplace_back(m_name + " destroyed", handle); }

private:
    std::vector<Event>& m_log;
    std::string m_name;
};

struct Delivery {
    unsigned handle;
    unsigned type;
    std::string text;
};
std::vector<Delivery> g_deliveries;
void deliver(unsigned handle, unsigned type, const char* text) { g_deliveries.push_back({handle, type, text}); }

class SessionInternalTest : public ::testing::Test {
protected:
    void SetUp() override { g_deliveries.clear(); }
    unsigned create(JexMessageCallback cb = deliver)
    {
        unsigned h = 0;
        EXPECT_EQ(JEX_SUCCESS, JexRT::createSession(cb, 0, nullptr, &h));
        return h;
    }
    testsupport::IsolatedEnvironment env;
};

TEST_F(SessionInternalTest, ListenersAreToldInOrderAndOnlyAfterRegistration)
{
    std::vector<Event> log;
    RecordingListener a(log, "a"), b(log, "b");
    const unsigned early = create();
    EXPECT_EQ(JEX_SUCCESS, JexRT::addSessionMessageListener(&a));
    EXPECT_EQ(JEX_FAILURE, JexRT::addSessionMessageListener(&a));
    EXPECT_EQ(JEX_SUCCESS, JexRT::addSessionMessageListener(&b));
    const unsigned late = create();
    EXPECT_EQ(JEX_SUCCESS, JexRT::destroySession(early | 0x0000FF00u)); // told the handle as passed
    EXPECT_EQ(JEX_FAILURE, JexRT::destroySession(early));               // nobody is told
    EXPECT_EQ(JEX_SUCCESS, JexRT::removeSessionMessageListener(&a));
    EXPECT_EQ(JEX_FAILURE, JexRT::removeSessionMessageListener(&a));
    EXPECT_EQ(JEX_SUCCESS, JexRT::destroySession(late));

    const std::vector<Event> expected = {{"a created", late},
                                         {"b created", late},
                                         {"a destroyed", early | 0x0000FF00u},
                                         {"b destroyed", early | 0x0000FF00u},
                                         {"b destroyed", late}};
    EXPECT_EQ(expected, log);
    JexRT::removeSessionMessageListener(&b);
}

TEST_F(SessionInternalTest, HostLayerMessagesReachEveryLiveSessionInCreationOrder)
{
    const unsigned older = create();
    const unsigned newer = create();
    Port_MsgDispatcher::dispatch(Port_MsgMan::MSG_DEBUG, L"quiet");
    ASSERT_EQ(2u, g_deliveries.size());
    EXPECT_EQ(older, g_deliveries[0].handle);
    EXPECT_EQ(newer, g_deliveries[1].handle);
    EXPECT_EQ(JEX_MSG_SILENT, g_deliveries[0].type);
    EXPECT_EQ("quiet", g_deliveries[0].text);

    JexRT::destroySession(older);
    g_deliveries.clear();
    Port_MsgDispatcher::dispatch(Port_MsgMan::MSG_TRACE, L"noise");
    ASSERT_EQ(1u, g_deliveries.size());
    EXPECT_EQ(newer, g_deliveries[0].handle);
    EXPECT_EQ(JEX_MSG_NOISE, g_deliveries[0].type);

    // Long texts are cut safely.
    Port_MsgDispatcher::dispatch(Port_MsgMan::MSG_INFO, std::wstring(3000, L'w').c_str());
    ASSERT_EQ(2u, g_deliveries.size());
    EXPECT_EQ(std::string(1023, 'w'), g_deliveries[1].text);
    JexRT::destroySession(newer);
}

TEST(VersionNumber, NibblesOfTheDigits)
{
    EXPECT_EQ(0x9200u, versionNumberFromText("9.2"));
    EXPECT_EQ(0x92100u, versionNumberFromText("9.2.1"));
    EXPECT_EQ(0x1012u, versionNumberFromText("10.1.2"));
    EXPECT_EQ(0u, versionNumberFromText(""));
}

} // namespace
