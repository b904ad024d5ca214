// A plug-in written in C against plugin.h alone, dropped into the plug-in
// tree of an installed copy of libJexJtag.so, is found without any setting,
// and so is the installation's device list: both come from the library's
// directory, in the plain layout (lib/, lib/plugins, share/jexjtag) and in
// the Debian multiarch one (lib/<triplet>/, lib/<triplet>/jexjtag/plugins,
// share/jexjtag).

#include <gtest/gtest.h>

#include <stdlib.h>
#include <filesystem>
#include <ostream>
#include <string>
#include <vector>

#include "PluginTree.hpp"
#include "jexjtag/db.h"
#include "jexjtag/session.h"
#include "platform/DynamicLibrary.hpp"
#include "support/TestSupport.hpp"

// Libraries that stay loaded until the process ends (reachable, so no leak).
std::vector<jexplatform::DynamicLibrary>* g_keptLoaded = new std::vector<jexplatform::DynamicLibrary>;

namespace {

namespace fs = std::filesystem;

template <typename Fn>
Fn need(const jexplatform::DynamicLibrary& lib, const char* name)
{
    Fn fn = lib.symbol<Fn>(name);
    if (!fn) ADD_FAILURE() << name << " is not exported";
    return fn;
}

struct Layout {
    const char* name;
    const char* libDir;     // relative to the prefix
    const char* pluginDir;  // relative to the prefix
};

void PrintTo(const Layout& layout, std::ostream* out) { *out << layout.name; }

class InstalledLayout : public ::testing::TestWithParam<Layout> {};

INSTANTIATE_TEST_SUITE_P(Layouts, InstalledLayout,
                         ::testing::Values(Layout{"Plain", "lib", "lib/plugins"},
                                           Layout{"Multiarch", "lib/x86_64-linux-gnu",
                                                  "lib/x86_64-linux-gnu/jexjtag/plugins"}),
                         [](const ::testing::TestParamInfo<Layout>& info) { return std::string(info.param.name); });

TEST_P(InstalledLayout, PluginsAndDeviceListAreFoundFromTheLibrarysDirectory)
{
    testsupport::TempDir prefix;
    testsupport::ScopedEnv home("HOME", prefix.str());
    // Neither directory setting: both come from where the library is.
    testsupport::ScopedEnv pluginDir("JEXJTAG_PLUGIN_DIR", ""), dataDir("JEXJTAG_DATA_DIR", "");
    unsetenv("JEXJTAG_PLUGIN_DIR");
    unsetenv("JEXJTAG_DATA_DIR");

    const fs::path lib = prefix / GetParam().libDir;
    fs::create_directories(lib);
    fs::copy_file(fs::canonical(fs::path(JEXJTAG_TEST_BUILD_DIR) / "lib" / "libJexJtag.so"), lib / "libJexJtag.so");
    // <prefix>/share/jexjtag/idcode.lst: every session reads the installation's list.
    fs::create_directories(prefix / "share" / "jexjtag");
    fs::copy_file(fs::path(JEXJTAG_TEST_BUILD_DIR) / "share" / "jexjtag" / "idcode.lst",
                  prefix / "share" / "jexjtag" / "idcode.lst");
    testsupport::PluginTree tree(prefix / GetParam().pluginDir);
    const std::string descriptor = "<?xml version=\"1.0\"?>\n"
                                   "<JexPlugin>\n"
                                   "  <description>Loopback cable written in C</description>\n"
                                   "  <targetname>loopback_cable</targetname>\n"
                                   "</JexPlugin>\n";
    tree.addModule("example", "loopback", "test_loopback_c");
    tree.addDescriptor("example", "loopback", descriptor);

    // Its own copy of the library, with its own process-wide state.
    jexplatform::DynamicLibrary jexjtag = jexplatform::DynamicLibrary::load((lib / "libJexJtag.so").string());
    ASSERT_TRUE(jexjtag.isLoaded()) << jexjtag.error();
    auto create = need<decltype(&JexJtag_session_create)>(jexjtag, "JexJtag_session_create");
    auto destroy = need<decltype(&JexJtag_session_destroy)>(jexjtag, "JexJtag_session_destroy");
    auto getCount = need<decltype(&JexJtag_session_getTargetCount)>(jexjtag, "JexJtag_session_getTargetCount");
    auto getSize =
        need<decltype(&JexJtag_session_getTargetXMLSizeByIndex)>(jexjtag, "JexJtag_session_getTargetXMLSizeByIndex");
    auto getTarget = need<decltype(&JexJtag_session_getTargetByIndex)>(jexjtag, "JexJtag_session_getTargetByIndex");
    auto lookup = need<decltype(&JexJtag_db_getIRLengthForIdcode)>(jexjtag, "JexJtag_db_getIRLengthForIdcode");
    ASSERT_TRUE(create && destroy && getCount && getSize && getTarget && lookup);

    unsigned h = 0;
    ASSERT_EQ(JEX_SUCCESS, create(nullptr, 0, nullptr, &h));
    unsigned count = 0;
    ASSERT_EQ(JEX_SUCCESS, getCount(h, &count));
    ASSERT_EQ(1u, count);
    unsigned size = 0;
    ASSERT_EQ(JEX_SUCCESS, getSize(h, 0, &size));
    ASSERT_EQ(descriptor.size() + 1, size);
    std::string xml(size, 'x');
    char name[64], plugin[64];
    ASSERT_EQ(JEX_SUCCESS, getTarget(h, 0, xml.data(), size, name, sizeof name, plugin, sizeof plugin));
    EXPECT_EQ(descriptor, std::string(xml.c_str()));
    EXPECT_STREQ("loopback_cable", name);
    EXPECT_STREQ("loopback", plugin);
    unsigned irlen = 0;  // XC7A35T, from the installation's idcode.lst
    EXPECT_EQ(JEX_SUCCESS, lookup(h, "00000011011000101101000010010011", &irlen));
    EXPECT_EQ(6u, irlen);
    EXPECT_EQ(JEX_SUCCESS, destroy(h));

    // The copy stays loaded until the process ends: its process-wide message
    // manager lives as long as the library does.
    g_keptLoaded->push_back(std::move(jexjtag));
}

} // namespace
