// SPDX-License-Identifier: MIT
// The descriptor reader, on the good-* and wrong-* descriptors in
// data/descriptors/.

#include <gtest/gtest.h>

#include <filesystem>
#include <map>
#include <string>
#include <vector>

#include "plugin/PluginXMLInfo.hpp"
#include "support/TestSupport.hpp"

namespace {

namespace fs = std::filesystem;
using Names = std::vector<std::string>;
using testsupport::LogCapture;

const fs::path kDescriptors = fs::path(JEXJTAG_TEST_SOURCE_DIR) / "tests/plugin/data/descriptors";

// What each good descriptor yields.
const std::map<std::string, Names> kGood = {
    {"good-minimal.xml", {"ormund_usbcable"}},
    {"good-three-names.xml", {"cable_a", "cable_b", "cable_a"}},
    {"good-blanks-kept.xml", {" spaced "}},
    {"good-line-breaks-kept.xml", {"\n  wrapped\n"}},
    // The parser reports the text in two pieces at the entity reference,
    // and every piece is a name of its own.
    {"good-entity-split.xml", {"left", "&right"}},
    {"good-outside-plugin.xml", {"outside"}},
    {"good-namespaced.xml", {"namespaced"}},
    {"good-empty-and-real.xml", {"real"}},
};

// The wrong descriptors the parser itself refuses ("Parse error!"); the
// others parse but are rejected without a message.
const std::map<std::string, bool> kWrong = {
    {"wrong-malformed.xml", true},          {"wrong-cut-off.xml", true},
    {"wrong-empty-file.xml", true},         {"wrong-not-xml.xml", true},
    {"wrong-no-plugin-element.xml", false}, {"wrong-empty-target-name.xml", false},
    {"wrong-no-target-name.xml", false},    {"wrong-letter-case.xml", false},
    {"wrong-near-miss-names.xml", false},
    // Nothing outside the file is fetched or read, and expansion is limited.
    {"wrong-external-dtd.xml", true},       {"wrong-external-entity.xml", true},
    {"wrong-entity-expansion.xml", true},
};

// True when a logged line ends with `text`.  A cut-off target name leaves its
// trace line open, and the next message goes on that line.
bool hasLineEnding(const LogCapture& log, const std::string& text)
{
    for (const std::string& line : log.lines())
        if (line.size() >= text.size() && line.compare(line.size() - text.size(), text.size(), text) == 0) return true;
    return false;
}

std::vector<fs::path> fixtures(const std::string& prefix)
{
    std::vector<fs::path> out;
    for (const auto& entry : fs::directory_iterator(kDescriptors))
        if (entry.path().filename().string().rfind(prefix, 0) == 0) out.push_back(entry.path());
    return out;
}

TEST(PluginXMLInfo, GoodDescriptorsYieldTheirNamesExactlyAsReported)
{
    const auto files = fixtures("good-");
    ASSERT_EQ(kGood.size(), files.size()) << "every good descriptor needs its expected names";
    for (const fs::path& file : files) {
        const auto expected = kGood.find(file.filename().string());
        ASSERT_NE(kGood.end(), expected) << file;
        Names names {"left over"};
        EXPECT_EQ(JEX_SUCCESS, JexRT::getPluginXMLInfo(file.string(), names)) << file;
        EXPECT_EQ(expected->second, names) << file;
    }
}

TEST(PluginXMLInfo, WrongDescriptorsAreRejectedWithAnEmptyList)
{
    const auto files = fixtures("wrong-");
    ASSERT_EQ(kWrong.size(), files.size()) << "every wrong descriptor needs its expectation";
    for (const fs::path& file : files) {
        const auto parseError = kWrong.find(file.filename().string());
        ASSERT_NE(kWrong.end(), parseError) << file;
        LogCapture log(5);
        Names names {"left over"};
        EXPECT_EQ(JEX_FAILURE, JexRT::getPluginXMLInfo(file.string(), names)) << file;
        EXPECT_TRUE(names.empty()) << file;
        EXPECT_TRUE(log.has("getPluginXMLInfo - Attempting to parse " + file.string() + "\n")) << file;
        EXPECT_EQ(parseError->second, hasLineEnding(log, "getPluginXMLInfo - Parse error!\n")) << file;
    }
}

TEST(PluginXMLInfo, UnreadableDescriptorsAreReportedAtLevelFive)
{
    // A missing file, and a directory where the descriptor should be.
    testsupport::TempDir dir;
    fs::create_directories(dir / "dir.xml");
    for (const std::string& path : {(dir / "absent.xml").string(), (dir / "dir.xml").string()}) {
        LogCapture log(5);
        Names names {"left over"};
        EXPECT_EQ(JEX_FAILURE, JexRT::getPluginXMLInfo(path, names));
        EXPECT_TRUE(names.empty());
        EXPECT_TRUE(log.has("getPluginXMLInfo - Cannot open xml file: " + path + "\n"));
        EXPECT_FALSE(log.has("getPluginXMLInfo - Attempting to parse " + path + "\n"));
    }
}

TEST(PluginXMLInfo, EveryCallRunsItsOwnParserCycle)
{
    // Many cycles in a row, interleaving accepted, refused and missing files,
    // leave the parser usable and give the same answers.
    const std::string good = (kDescriptors / "good-minimal.xml").string();
    const std::string bad = (kDescriptors / "wrong-malformed.xml").string();
    for (int i = 0; i < 20; ++i) {
        Names names;
        EXPECT_EQ(JEX_SUCCESS, JexRT::getPluginXMLInfo(good, names));
        EXPECT_EQ(Names {"ormund_usbcable"}, names);
        EXPECT_EQ(JEX_FAILURE, JexRT::getPluginXMLInfo(bad, names));
        EXPECT_EQ(JEX_FAILURE, JexRT::getPluginXMLInfo("/nonexistent/x.xml", names));
    }
}

TEST(PluginXMLInfo, PathsWithNonAsciiCharactersAreRead)
{
    testsupport::TempDir dir;
    const fs::path file = dir / "k\xC3\xA4""bel" / "k\xC3\xA4""bel.xml";
    testsupport::writeFile(file, "<JexPlugin><targetname>k\xC3\xA4""bel_usb</targetname></JexPlugin>");
    Names names;
    EXPECT_EQ(JEX_SUCCESS, JexRT::getPluginXMLInfo(file.string(), names));
    EXPECT_EQ(Names {"k\xC3\xA4""bel_usb"}, names);
}

} // namespace
