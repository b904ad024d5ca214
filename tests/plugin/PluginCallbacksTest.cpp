// SPDX-License-Identifier: MIT
// The host callback table as a plug-in sees it.

#include <gtest/gtest.h>

#include <cstring>
#include <string>
#include <vector>

#include "PluginTree.hpp"
#include "jexjtag/JexRT.hpp"
#include "plugin/PluginManager.hpp"
#include "session/Session.hpp"
#include "session/SessionRegistry.hpp"
#include "support/EntryLog.hpp"
#include "support/TestSupport.hpp"

namespace {

using Lines = std::vector<std::string>;
using JexRT::Session;
using testsupport::LogCapture;
using testsupport::PluginTree;

using testsupport::messages;

class PluginCallbacksTest : public ::testing::Test {
protected:
    void SetUp() override
    {
        messages().clear();
        tree.add("acme", "alpha", "test_counting_alpha", {"alpha_usb"});
    }
    unsigned createSession(std::vector<const char*> args = {})
    {
        unsigned h = 0;
        EXPECT_EQ(JEX_SUCCESS, JexRT::createSession(testsupport::keepMessage, static_cast<unsigned>(args.size()), args.data(), &h));
        return h;
    }
    // Asks the instance to run one of its callback commands.
    static unsigned command(JexPluginInstance* instance, const char* text, const uint8_t* in = nullptr,
                            uint32_t inLength = 0)
    {
        uint32_t outLength = 0;
        return instance->ops->sendCommand(instance, text, in, inLength, nullptr, &outLength, nullptr);
    }

    testsupport::IsolatedEnvironment env;
    PluginTree tree {env.pluginRoot()};
    testsupport::EntryLog entries;
};

TEST_F(PluginCallbacksTest, APluginMessageReachesTheHostOfTheSessionItNames)
{
    const unsigned first = createSession();
    const unsigned second = createSession();
    ASSERT_NE(nullptr, Session::m_pluginManager);
    JexPluginInstance* instance = Session::m_pluginManager->createPluginInstance("alpha_usb");
    ASSERT_NE(nullptr, instance);

    instance->ops->setSessionHandle(instance, second);
    EXPECT_EQ(JEX_SUCCESS, command(instance, "message 1024 hello host"));
    ASSERT_EQ(1u, messages().size());
    EXPECT_EQ(second, messages()[0].handle);
    EXPECT_EQ(unsigned {JEX_MSG_INFO}, messages()[0].type);
    EXPECT_EQ("hello host", messages()[0].text);

    // Extra bits reach the same session, which answers with its own handle;
    // every type passes unchanged.
    instance->ops->setSessionHandle(instance, first | 0xAB00FF07u);
    EXPECT_EQ(JEX_SUCCESS, command(instance, "message 7 debug text"));
    ASSERT_EQ(2u, messages().size());
    EXPECT_EQ(first, messages()[1].handle);
    EXPECT_EQ(7u, messages()[1].type);

    // No session with that handle: dropped.
    instance->ops->setSessionHandle(instance, 0x00770000u);
    EXPECT_EQ(JEX_SUCCESS, command(instance, "message 256 nobody listens"));
    EXPECT_EQ(2u, messages().size());

    Session::m_pluginManager->destroyPluginInstance("alpha_usb", instance);
    JexRT::destroySession(first);
    JexRT::destroySession(second);
}

TEST_F(PluginCallbacksTest, PluginLogCallsReachTheLibraryLog)
{
    const unsigned h = createSession();
    JexPluginInstance* instance = Session::m_pluginManager->createPluginInstance("alpha_usb");
    ASSERT_NE(nullptr, instance);
    {
        LogCapture log(5);
        EXPECT_EQ(JEX_SUCCESS, command(instance, "log 2 plug-in says 100%"));
        const uint8_t bytes[] = {0xAB, 0xCD};
        EXPECT_EQ(JEX_SUCCESS, command(instance, "dump 5", bytes, 16));
        EXPECT_EQ(JEX_SUCCESS, command(instance, "trace shiftChainIR"));
        EXPECT_TRUE(log.has("plug-in says 100%\n"));
        EXPECT_TRUE(log.has("counting dump (16 bits)\n"));
        EXPECT_TRUE(log.has("  00000000: AB CD\n"));
        EXPECT_TRUE(log.has("> shiftChainIR\n"));
        EXPECT_TRUE(log.has("< shiftChainIR\n"));
    }
    {
        // Levels the log does not write cost the plug-in nothing visible.
        LogCapture log(1);
        EXPECT_EQ(JEX_SUCCESS, command(instance, "log 2 not written"));
        EXPECT_FALSE(log.has("not written\n"));
    }
    Session::m_pluginManager->destroyPluginInstance("alpha_usb", instance);
    JexRT::destroySession(h);
}

} // namespace
