// SPDX-License-Identifier: MIT
// PluginManager on real modules in real per-test plug-in trees: loading and
// its entry-point checks, discovery, instances, unloading and the target list.

#include <gtest/gtest.h>

#include <algorithm>
#include <cstring>
#include <memory>
#include <string>
#include <vector>

#include "PluginTree.hpp"
#include "plugin/PluginManager.hpp"
#include "support/EntryLog.hpp"
#include "support/TestSupport.hpp"

namespace {

namespace fs = std::filesystem;
using Lines = std::vector<std::string>;
using JexRT::PluginManager;
using JexRT::PluginModule;
using testsupport::LogCapture;
using testsupport::PluginTree;

const std::string kDiscovery = "PluginManager::addAllPlugins() - ";

// The discovery lines of `log`, in order.
Lines discoveryLines(const LogCapture& log)
{
    Lines out;
    for (const std::string& line : log.lines())
        if (line.compare(0, kDiscovery.size(), kDiscovery) == 0) out.push_back(line);
    return out;
}

struct Target {
    unsigned status;
    std::string xml;
    std::string type;
    std::string plugin;
};

Target targetAt(PluginManager& manager, unsigned index, unsigned bufferSize = 4096)
{
    std::vector<char> buf(bufferSize, 'x');
    Target t {};
    t.status = manager.getTargetByIndex(index, buf.data(), bufferSize, &t.type, &t.plugin);
    t.xml.assign(buf.data());
    return t;
}

class PluginManagerTest : public ::testing::Test {
protected:
    std::string root() const { return env.pluginRoot().string(); }

    testsupport::IsolatedEnvironment env;
    PluginTree tree {env.pluginRoot()};
    testsupport::EntryLog entries;
};

TEST_F(PluginManagerTest, AnEmptyNameOrAnUnloadableModuleIsRefused)
{
    PluginManager manager;
    PluginModule module;
    LogCapture log(2);
    EXPECT_EQ(JEX_FAILURE, manager.loadModule("", PluginTree::builtModule("test_counting_alpha").string(), module));
    EXPECT_FALSE(module.handle.isLoaded());
    EXPECT_TRUE(entries.lines().empty()); // an empty name never reaches the loader
    EXPECT_EQ(JEX_FAILURE, manager.loadModule("ghost", root() + "/nowhere/ghost.so", module));
    EXPECT_TRUE(log.has("PluginManager::loadModule(ghost) - Failed loading module\n"));
}

TEST_F(PluginManagerTest, AModuleLackingAnyEntryPointIsRefusedAndFreedAgain)
{
    PluginManager manager;
    for (const std::string entry : {"create", "destroy", "loaded", "unloaded", "setcallbacks"}) {
        SCOPED_TRACE(entry);
        entries.clear();
        LogCapture log(3);
        const std::string path = PluginTree::builtModule("test_missing_" + entry).string();
        PluginModule module;
        EXPECT_EQ(JEX_FAILURE, manager.loadModule("missing_" + entry, path, module));
        EXPECT_TRUE(log.has("PluginManager::loadModule(missing_" + entry +
                            ") - Not all required functions were implemented in plugin\n"));
        EXPECT_TRUE(log.has("PluginManager::unloadModule() - Successfully unloaded plugin: " + path + "\n"));
        EXPECT_FALSE(module.handle.isLoaded());
        // Neither loaded nor setCallbacks; unloaded once when the module has it.
        const Lines expected = entry == "unloaded" ? Lines {} : Lines {"unloaded"};
        EXPECT_EQ(expected, entries.of("missing_" + entry));
    }
}

TEST_F(PluginManagerTest, DiscoveryWalksTwoLevelsAndLoadsOnlyDescribedPlugins)
{
    testsupport::writeFile(env.pluginRoot() / "README", "not a company");
    tree.add("acme", "alpha", "test_counting_alpha", {"alpha_usb", "alpha_eth"});
    tree.addModule("acme", "nodesc", "test_counting_beta"); // no descriptor: never loaded
    testsupport::writeFile(env.pluginRoot() / "acme" / "notes.txt", "not a plug-in");
    // Deeper than a plug-in directory: not looked at.
    tree.add("acme/alpha", "deeper", "test_counting_gamma", {"deep"});

    LogCapture log(3);
    PluginManager manager;
    const std::string acme = root() + "/acme";
    const std::string& prefix = kDiscovery;
    EXPECT_EQ((Lines {
                  prefix + "Searching for Company Directories in: " + root() + "\n",
                  prefix + "Found " + root() + "/README, isDir? No\n",
                  prefix + "Found " + acme + ", isDir? Yes\n",
                  prefix + "Searching for Plug-in Directories in: " + acme + "\n",
                  prefix + "Found " + acme + "/alpha, isDir? Yes\n",
                  prefix + "Valid Plugin xml found: " + acme + "/alpha/alpha.xml\n",
                  prefix + "Loaded " + acme + "/alpha/alpha.so successfully.\n",
                  prefix + "Found " + acme + "/nodesc, isDir? Yes\n",
                  prefix + "Found " + acme + "/notes.txt, isDir? No\n",
              }),
              discoveryLines(log));
    EXPECT_EQ((Lines {"loaded", "setCallbacks complete"}), entries.of("alpha"));
    EXPECT_TRUE(entries.of("beta").empty());
    EXPECT_TRUE(entries.of("gamma").empty());
    EXPECT_EQ(1u, manager.getModuleCount());

    ASSERT_EQ(2u, manager.getTargetCount());
    EXPECT_EQ("alpha_usb", targetAt(manager, 0).type);
    EXPECT_EQ("alpha_eth", targetAt(manager, 1).type);
}

TEST_F(PluginManagerTest, RefreshAddsOnlyNewPluginsAndKeepsIndices)
{
    tree.add("acme", "alpha", "test_counting_alpha", {"alpha_usb", "alpha_eth"});
    PluginManager manager;
    {
        LogCapture log(3);
        EXPECT_EQ(JEX_FAILURE, manager.refreshTargetList());
        EXPECT_EQ(1u, log.count(kDiscovery + "alpha is already loaded!\n"));
        EXPECT_FALSE(log.has(kDiscovery + "Valid Plugin xml found: " + tree.xmlPath("acme", "alpha") + "\n"));
    }
    EXPECT_EQ(2u, manager.getTargetCount());

    // A changed descriptor of a loaded plug-in is not taken over.
    tree.addDescriptor("acme", "alpha", PluginTree::descriptor({"renamed"}));
    tree.add("acme", "beta", "test_counting_beta", {"beta_jtag"});
    tree.add("zeta", "gamma", "test_counting_gamma", {"gamma_one", "gamma_two"});
    EXPECT_EQ(JEX_SUCCESS, manager.refreshTargetList());
    ASSERT_EQ(5u, manager.getTargetCount());
    const Lines expected {"alpha_usb", "alpha_eth", "beta_jtag", "gamma_one", "gamma_two"};
    for (unsigned i = 0; i < expected.size(); ++i) EXPECT_EQ(expected[i], targetAt(manager, i).type) << i;
    EXPECT_EQ("gamma", targetAt(manager, 4).plugin);
    // Each module was loaded once.
    EXPECT_EQ(1u, entries.count("alpha loaded"));
    EXPECT_EQ(1u, entries.count("beta loaded"));
    EXPECT_EQ(1u, entries.count("gamma loaded"));
}

TEST_F(PluginManagerTest, AFailingPluginIsTriedAgainAtEveryDiscoveryAndNeverListed)
{
    tree.add("acme", "broken", "test_missing_create", {"broken_cable"});
    LogCapture log(3);
    PluginManager manager;
    EXPECT_EQ(JEX_FAILURE, manager.refreshTargetList());
    EXPECT_EQ(2u, log.count(kDiscovery + "Valid Plugin xml found: " + tree.xmlPath("acme", "broken") + "\n"));
    EXPECT_EQ(2u, log.count("PluginManager::loadModule(broken) - Not all required functions were implemented in "
                            "plugin\n"));
    EXPECT_EQ(0u, manager.getTargetCount());
    EXPECT_EQ((Lines {"unloaded", "unloaded"}), entries.of("missing_create"));

    // Fixed in place: the next discovery loads it.
    tree.add("acme", "broken", "test_counting_alpha", {"broken_cable"});
    EXPECT_EQ(JEX_SUCCESS, manager.refreshTargetList());
    EXPECT_EQ(1u, manager.getTargetCount());
}

TEST_F(PluginManagerTest, ATypeServedTwiceResolvesToThePluginLoadedLast)
{
    tree.add("acme", "alpha", "test_counting_alpha", {"shared", "only_alpha"});
    tree.add("acme", "beta", "test_counting_beta", {"shared"});
    PluginManager manager;
    ASSERT_EQ(3u, manager.getTargetCount());
    const Target first = targetAt(manager, 0);
    const Target third = targetAt(manager, 2);
    EXPECT_EQ("shared", first.type);
    EXPECT_EQ("shared", third.type);
    EXPECT_EQ("beta", first.plugin);
    EXPECT_EQ("beta", third.plugin);
    EXPECT_EQ(PluginTree::descriptor({"shared"}), first.xml);
    EXPECT_EQ("alpha", targetAt(manager, 1).plugin);

    JexPluginInstance* instance = manager.createPluginInstance("shared");
    ASSERT_NE(nullptr, instance);
    manager.destroyPluginInstance("shared", instance);
    EXPECT_EQ((Lines {"loaded", "setCallbacks complete", "create 1", "destroy 1"}), entries.of("beta"));
    EXPECT_EQ((Lines {"loaded", "setCallbacks complete"}), entries.of("alpha"));
}

TEST_F(PluginManagerTest, InstancesComeFromTheModuleServingTheType)
{
    tree.add("acme", "alpha", "test_counting_alpha", {"alpha_usb"});
    tree.add("acme", "nothing", "test_null_create", {"empty_handed"});
    PluginManager manager;

    JexPluginInstance* one = manager.createPluginInstance("alpha_usb");
    JexPluginInstance* two = manager.createPluginInstance("alpha_usb");
    ASSERT_NE(nullptr, one);
    ASSERT_NE(nullptr, two);
    EXPECT_NE(one, two);
    ASSERT_NE(nullptr, one->ops);
    ASSERT_NE(nullptr, one->ops->setSessionHandle);
    one->ops->setSessionHandle(one, 0x00030000u);
    manager.destroyPluginInstance("alpha_usb", two);
    manager.destroyPluginInstance("alpha_usb", one);
    EXPECT_EQ((Lines {"loaded", "setCallbacks complete", "create 1", "create 2", "setSessionHandle 1 196608",
                      "destroy 2", "destroy 1"}),
              entries.of("alpha"));

    // A null instance is no error here, and nothing is destroyed for it.
    EXPECT_EQ(nullptr, manager.createPluginInstance("empty_handed"));
    EXPECT_EQ((Lines {"loaded", "setCallbacks", "create null"}), entries.of("null_create"));

    LogCapture log(1);
    EXPECT_EQ(nullptr, manager.createPluginInstance("nope"));
    EXPECT_EQ(nullptr, manager.createPluginInstance("nope"));
    EXPECT_EQ(2u, log.count("PluginManager::createPluginInstance(nope) - No key for this type\n"));
    manager.destroyPluginInstance("nope", nullptr);
    EXPECT_TRUE(log.has("PluginManager::destroyPluginInstance(nope) - No key for this type\n"));
    EXPECT_EQ(7u, entries.of("alpha").size()); // nothing destroyed
    EXPECT_EQ(2u, manager.getTargetCount());   // and the failed lookups added nothing
}

TEST_F(PluginManagerTest, DestructionUnloadsEveryModuleOnceLastLoadedFirst)
{
    tree.add("acme", "alpha", "test_counting_alpha", {"a"});
    tree.add("acme", "beta", "test_counting_beta", {"b"});
    tree.add("zeta", "gamma", "test_counting_gamma", {"c"});
    auto manager = std::make_unique<PluginManager>();
    JexPluginInstance* instance = manager->createPluginInstance("b");
    manager->destroyPluginInstance("b", instance);
    entries.clear();

    LogCapture log(3);
    manager.reset();
    EXPECT_EQ((Lines {"gamma unloaded", "beta unloaded", "alpha unloaded"}), entries.lines());
    for (const auto& [company, name] : {std::pair {"acme", "alpha"}, {"acme", "beta"}, {"zeta", "gamma"}})
        EXPECT_EQ(1u, log.count("PluginManager::unloadModule() - Successfully unloaded plugin: " +
                                tree.modulePath(company, name) + "\n"));
}

TEST_F(PluginManagerTest, TheDescriptionIsTheDescriptorFileReadAtEachCall)
{
    // A 120-byte descriptor with bare line feeds and two targets.
    std::string text = "<JexPlugin>\n<targetname>one</targetname>\n<targetname>two</targetname>\n</JexPlugin>\n";
    text += "<!-- " + std::string(120 - text.size() - 10, 'p') + " -->\n";
    ASSERT_EQ(120u, text.size());
    tree.addModule("acme", "alpha", "test_counting_alpha");
    tree.addDescriptor("acme", "alpha", text);
    PluginManager manager;
    ASSERT_EQ(2u, manager.getTargetCount());

    EXPECT_EQ(121u, manager.getXMLSizeByIndex(0));
    // Exactly the room needed, then a cut text.
    for (const auto& [index, size] : {std::pair {0u, 121u}, {1u, 10u}})
        EXPECT_EQ(text.substr(0, size - 1), targetAt(manager, index, size).xml);
    EXPECT_EQ("two", targetAt(manager, 1, 10).type);

    // Changed on disk: the new text; the list stays as discovered.
    tree.addDescriptor("acme", "alpha", PluginTree::descriptor({"three"}));
    EXPECT_EQ(PluginTree::descriptor({"three"}), targetAt(manager, 0).xml);
    EXPECT_EQ("one", targetAt(manager, 0).type);

    testsupport::writeFile(tree.xmlPath("acme", "alpha"), "");
    EXPECT_EQ(0u, manager.getXMLSizeByIndex(0));

    fs::remove(tree.xmlPath("acme", "alpha"));
    EXPECT_EQ(0u, manager.getXMLSizeByIndex(0));
    char buf[16] = "untouched";
    std::string type = "old", plugin = "old";
    EXPECT_EQ(JEX_FAILURE, manager.getTargetByIndex(0, buf, sizeof buf, &type, &plugin));
    EXPECT_STREQ("untouched", buf);
    EXPECT_EQ("old", type);
    EXPECT_EQ(2u, manager.getTargetCount());
}

TEST_F(PluginManagerTest, AnEmptyTreeListsNothingAndIndexOperationsRefuseBadArguments)
{
    LogCapture log(3);
    PluginManager manager;
    EXPECT_EQ(root(), manager.getPluginRoot());
    EXPECT_EQ((Lines {kDiscovery + "Searching for Company Directories in: " + root() + "\n"}), discoveryLines(log));
    EXPECT_EQ(0u, manager.getTargetCount());
    EXPECT_EQ(JEX_FAILURE, manager.addAllPlugins());

    EXPECT_EQ(0u, manager.getXMLSizeByIndex(0));
    EXPECT_TRUE(log.has("PluginManager::getXMLSizeByIndex() - Invalid argument\n"));
    char buf[8];
    std::string type, plugin;
    EXPECT_EQ(JEX_FAILURE, manager.getTargetByIndex(0, buf, sizeof buf, &type, &plugin));
    EXPECT_TRUE(log.has("PluginManager::getTargetByIndex() - Invalid argument\n"));

    tree.add("acme", "alpha", "test_counting_alpha", {"a"});
    manager.refreshTargetList();
    EXPECT_EQ(JEX_FAILURE, manager.getTargetByIndex(0, nullptr, 8, &type, &plugin));
    EXPECT_EQ(JEX_FAILURE, manager.getTargetByIndex(0, buf, 0, &type, &plugin));
    EXPECT_EQ(JEX_FAILURE, manager.getTargetByIndex(0, buf, sizeof buf, nullptr, &plugin));
    EXPECT_EQ(JEX_FAILURE, manager.getTargetByIndex(1, buf, sizeof buf, &type, &plugin));
    EXPECT_EQ(JEX_SUCCESS, manager.getTargetByIndex(0, buf, sizeof buf, &type, &plugin));
}

} // namespace
