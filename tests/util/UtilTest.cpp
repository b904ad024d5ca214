// SPDX-License-Identifier: MIT
// The utility layer: argument lookup, texts, private temporary files and the
// logger's sink.

#include <gtest/gtest.h>

#include <sys/stat.h>

#include <filesystem>

#include "support/TestSupport.hpp"
#include "util/Jex_Util.hpp"
#include "util/Logger.hpp"
#include "util/TraceText.hpp"

using testsupport::ScopedEnv;
using testsupport::TempDir;

namespace {

TEST(JexUtil, FindKeyIgnoresKeyCaseAndTakesTheLastOccurrence)
{
    const std::vector<std::string> args = {"datadir=/a", "noequals", "DataDir=/b", "port=", "x=y=z"};
    EXPECT_EQ("/b", Jex_Util::findKey(args, "datadir"));
    EXPECT_EQ("", Jex_Util::findKey(args, "port"));
    EXPECT_EQ("y=z", Jex_Util::findKey(args, "x"));
    EXPECT_EQ("", Jex_Util::findKey(args, "noequals"));
    EXPECT_EQ("", Jex_Util::findKey(args, "data"));
    const char* argv[] = {"AVOID_FIRMWARE_UPDATE=TRUE", nullptr};
    EXPECT_EQ("TRUE", Jex_Util::findKey(2, argv, "avoid_firmware_update"));
    EXPECT_EQ("", Jex_Util::findKey(3, nullptr, "a"));
}

TEST(JexUtil, TemporaryFilesArePrivateUniqueAndStayInLumenfold)
{
    TempDir home;
    ScopedEnv env("HOME", home.str());
    const std::filesystem::path dir = home.path() / ".lumenfold";

    const std::string a = Jex_Util::createDotLumenfoldTempFile("chip.bsd");
    const std::string b = Jex_Util::createDotLumenfoldTempFile("chip.bsd");
    EXPECT_NE(a, b);
    struct stat st {};
    ASSERT_EQ(0, stat(dir.c_str(), &st));
    EXPECT_EQ(0700u, st.st_mode & 0777u);
    ASSERT_EQ(0, stat(a.c_str(), &st));
    EXPECT_EQ(0600u, st.st_mode & 0777u);

    for (const char* hostile : {"../../escape", "..", "a/b\\c", "/etc/passwd", ""}) {
        const std::filesystem::path p = Jex_Util::createDotLumenfoldTempFile(hostile);
        EXPECT_EQ(dir, p.parent_path()) << hostile;
        EXPECT_TRUE(std::filesystem::exists(p)) << hostile;
    }
    EXPECT_FALSE(std::filesystem::exists(home.path() / "escape"));
}

TEST(Logger, WritesOnlyEnabledLevelsWithItsPrefix)
{
    TempDir dir;
    const std::string path = (dir / "log.txt").string();
    Logger::logger.configure(2, path);
    Logger::logger.printLog(3, "hidden %d\n", 3);
    Logger::logger.printLog(2, "shown %s\n", "two");
    Logger::logger.printLog(0, "never\n");
    const unsigned char bytes[] = {0x01, 0xAB, 0xFF};
    Logger::logger.dumpBuffer(2, "TDI:", bytes, 17); // 17 bits: three bytes
    Logger::logger.dumpBuffer(5, "TDO:", bytes, 8);
    Logger::logger.configure(0, "");
    EXPECT_EQ("[jexjtag 2] shown two\n"
              "[jexjtag 2] TDI: (17 bits)\n"
              "[jexjtag 2]   00000000: 01 AB FF\n",
              testsupport::readFile(path));
}

} // namespace
