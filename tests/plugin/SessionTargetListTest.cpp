// SPDX-License-Identifier: MIT
// The target list through the exported session functions of libJexJtag.so,
// and the plug-in modules' life with the sessions.

#include <gtest/gtest.h>

#include <cstring>
#include <string>
#include <vector>

#include "PluginTree.hpp"
#include "jexjtag/jexjtag.h"
#include "support/EntryLog.hpp"
#include "support/TestSupport.hpp"

namespace {

using testsupport::LogCapture;
using testsupport::PluginTree;

class SessionTargetListTest : public ::testing::Test {
protected:
    unsigned create(std::vector<const char*> args = {})
    {
        unsigned h = 0;
        EXPECT_EQ(JEX_SUCCESS,
                  JexJtag_session_create(nullptr, static_cast<unsigned>(args.size()), args.data(), &h));
        return h;
    }
    unsigned count(unsigned h)
    {
        unsigned n = 12345;
        EXPECT_EQ(JEX_SUCCESS, JexJtag_session_getTargetCount(h, &n));
        return n;
    }

    testsupport::IsolatedEnvironment env;
    PluginTree tree {env.pluginRoot()};
    testsupport::EntryLog entries;
};

TEST_F(SessionTargetListTest, HostsListTargetsWithNamesAndDescriptions)
{
    tree.add("acme", "alpha", "test_counting_alpha", {"alpha_usb", "alpha_eth"});
    tree.add("zeta", "loopback", "test_loopback_c", {"loopback_cable"});
    const unsigned h = create();
    ASSERT_EQ(3u, count(h));

    const std::string xml = PluginTree::descriptor({"loopback_cable"});
    unsigned size = 0;
    ASSERT_EQ(JEX_SUCCESS, JexJtag_session_getTargetXMLSizeByIndex(h, 2, &size));
    EXPECT_EQ(xml.size() + 1, size);

    std::vector<char> buf(size, 'x');
    char name[64], plugin[64];
    ASSERT_EQ(JEX_SUCCESS,
              JexJtag_session_getTargetByIndex(h, 2, buf.data(), size, name, sizeof name, plugin, sizeof plugin));
    EXPECT_EQ(xml, std::string(buf.data()));
    EXPECT_STREQ("loopback_cable", name);
    EXPECT_STREQ("loopback", plugin);

    // Name buffers cut the names, always terminated.
    ASSERT_EQ(JEX_SUCCESS, JexJtag_session_getTargetByIndex(h, 1, buf.data(), size, name, 1, plugin, 4));
    EXPECT_STREQ("", name);
    EXPECT_STREQ("alp", plugin);

    // A failure from the manager leaves the name buffers as they were.
    std::strcpy(name, "kept");
    EXPECT_EQ(JEX_FAILURE, JexJtag_session_getTargetByIndex(h, 3, buf.data(), size, name, sizeof name, plugin,
                                                            sizeof plugin));
    EXPECT_STREQ("kept", name);
    EXPECT_EQ(JEX_SUCCESS, JexJtag_session_getTargetXMLSizeByIndex(h, 3, &size));
    EXPECT_EQ(0u, size);
    JexJtag_session_destroy(h);
}

TEST_F(SessionTargetListTest, RefreshAndSearchPathPickUpNewPlugins)
{
    const unsigned h = create();
    EXPECT_EQ(0u, count(h));
    EXPECT_EQ(JEX_SUCCESS, JexJtag_session_refreshTargetList(h)); // nothing new: still success

    tree.add("acme", "alpha", "test_counting_alpha", {"alpha_usb"});
    EXPECT_EQ(JEX_SUCCESS, JexJtag_session_refreshTargetList(h));
    EXPECT_EQ(1u, count(h));

    // The search path is kept for the host; the tree walked stays the same,
    // once per call.
    tree.add("acme", "beta", "test_counting_beta", {"beta_jtag"});
    {
        LogCapture log(3);
        EXPECT_EQ(JEX_SUCCESS, JexJtag_session_setPluginSearchPath(h, "/opt/other"));
        EXPECT_EQ(1u, log.count("PluginManager::addAllPlugins() - Searching for Company Directories in: " +
                                env.pluginRoot().string() + "\n"));
    }
    EXPECT_EQ(2u, count(h));
    char path[32];
    ASSERT_EQ(JEX_SUCCESS, JexJtag_session_getPluginSearchPath(h, path, sizeof path));
    EXPECT_STREQ("/opt/other", path);
    JexJtag_session_destroy(h);
}

TEST_F(SessionTargetListTest, TheLastSessionUnloadsEveryModuleUnlessTurnedOff)
{
    tree.add("acme", "alpha", "test_counting_alpha", {"alpha_usb"});
    tree.add("acme", "beta", "test_counting_beta", {"beta_jtag"});
    const unsigned a = create();
    const unsigned b = create();
    EXPECT_EQ(1u, entries.count("alpha loaded"));
    JexJtag_session_destroy(a);
    EXPECT_EQ(0u, entries.count("alpha unloaded"));
    JexJtag_session_destroy(b);
    EXPECT_EQ(1u, entries.count("alpha unloaded"));
    EXPECT_EQ(1u, entries.count("beta unloaded"));

    const unsigned keep = create({"unloadtargetsondestroy=false"});
    EXPECT_EQ(2u, entries.count("alpha loaded"));
    JexJtag_session_destroy(keep);
    EXPECT_EQ(1u, entries.count("alpha unloaded"));
    const unsigned again = create();
    EXPECT_EQ(2u, entries.count("alpha loaded")); // still loaded, shared
    EXPECT_EQ(2u, count(again));
    JexJtag_session_destroy(again);
    EXPECT_EQ(1u, entries.count("alpha unloaded"));

    const unsigned last = create({"unloadtargetsondestroy=true"});
    JexJtag_session_destroy(last);
    EXPECT_EQ(2u, entries.count("alpha unloaded"));
    EXPECT_EQ(2u, entries.count("beta unloaded"));
}

} // namespace
