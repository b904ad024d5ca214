// SPDX-License-Identifier: MIT
// DeviceDB and DeviceRecord, the session's device operations, and where a
// session finds its idcode.lst.

#include <gtest/gtest.h>

#include <functional>
#include <sstream>
#include <string>
#include <type_traits>
#include <utility>
#include <vector>

#include "datafile/StaticAcdRead.hpp"
#include "jexjtag/JexRT.hpp"
#include "session/Session.hpp"
#include "session/SessionRegistry.hpp"
#include "support/TestSupport.hpp"
#include "util/Jex_Util.hpp"

using JexRT::DeviceDB;
using JexRT::DeviceRecord;
using JexRT::IDCode;
using testsupport::IsolatedEnvironment;
using testsupport::LogCapture;
using testsupport::TempDir;
using testsupport::writeFile;

namespace {

const std::string P = "00001010000000000001000010010011"; // 0x0A001093

std::string messageOf(const std::function<void()>& f)
{
    try {
        f();
    } catch (const Jex_Exception& e) {
        return e.getMessage();
    }
    return "";
}

class DeviceDbTest : public ::testing::Test {
protected:
    void TearDown() override { Jex_Util::setUserDataDirPath(""); }
    unsigned create(const std::vector<std::string>& args = {})
    {
        std::vector<const char*> argv;
        for (const std::string& a : args) argv.push_back(a.c_str());
        unsigned handle = 0;
        JexRT::createSession(nullptr, static_cast<unsigned>(argv.size()), argv.empty() ? nullptr : argv.data(),
                             &handle);
        return handle;
    }
    IsolatedEnvironment env;
};

} // namespace

static_assert(!std::is_copy_constructible_v<DeviceDB> && !std::is_copy_assignable_v<DeviceDB>,
              "a database owns its entries");

TEST_F(DeviceDbTest, InitReadsTheDataDirectorysListAsInstallationEntries)
{
    writeFile(env.dataDir() / "idcode.lst", P + " 6 1 2 DEVA\n");
    LogCapture log(2);
    DeviceDB db;
    db.init();
    const std::string path = (env.dataDir() / "idcode.lst").string();
    EXPECT_TRUE(log.has("*** Opening file " + path + "\n"));
    EXPECT_TRUE(log.has("*** Reached DeviceDB::read  filename=" + path + " (and .acd if available)\n"));
    EXPECT_TRUE(log.has("*** Successfully completed DeviceDB::read\n"));
    // The record's other fields reach hosts through idcodeLookup (DeviceDbApiTest).
    const DeviceRecord record = db.getRecord(IDCode(0x0A001093u));
    EXPECT_EQ("DEVA", record.getDeviceName());
    EXPECT_FALSE(record.isUserList());
    EXPECT_EQ("DEVA", db.getRecord(IDCode(std::string("1010000000000001000010010011"))).getDeviceName());
}

TEST_F(DeviceDbTest, FailuresBecomeJexExceptionsAndKeepWhatWasRead)
{
    DeviceDB db;
    EXPECT_EQ("Invalid DeviceRecord.", messageOf([&] { db.getRecord(IDCode(0u)); }));
    EXPECT_EQ("Invalid DeviceRecord.", messageOf([] { DeviceRecord record(nullptr); }));

    LogCapture log(2);
    std::istringstream good(P + " 6 1 2 DEVA\n");
    db.read("mine.lst", good, true);
    EXPECT_TRUE(log.has("*** Reached DeviceDB::read  filename=mine.lst\n"));
    std::istringstream bad("1" + P.substr(1) + " 4 0 0 KEPT\nZ\n");
    const std::string message = "Input error in file: mine.lst line:1 - invalid character in idcode.";
    EXPECT_EQ(message, messageOf([&] { db.read("mine.lst", bad, true); }));
    EXPECT_TRUE(log.has("*** EXCEPTION: " + message + "\n"));
    EXPECT_EQ("DEVA", db.getRecord(IDCode(0x0A001093u)).getDeviceName());
    EXPECT_EQ("KEPT", db.getRecord(IDCode(0x8A001093u)).getDeviceName());

    const std::string missing = (env.root() / "none.lst").string();
    EXPECT_EQ("Error: Unable to open " + missing, messageOf([&] { db.read(missing, false); }));
    EXPECT_EQ(2u, db.getDeviceData().getEntryCount());

    db.clear();
    EXPECT_EQ(0u, db.getDeviceData().getEntryCount());
    std::istringstream again(std::string(32, '1') + " 4 0 0 ONLY\n");
    db.read("again.lst", again, false);
    EXPECT_EQ(1u, db.getDeviceData().getEntryCount());
    EXPECT_EQ("Invalid DeviceRecord.", messageOf([&] { db.getRecord(IDCode(0x0A001093u)); }));
}

TEST_F(DeviceDbTest, DatadirWithAndWithoutTrailingSeparatorAndEmpty)
{
    TempDir other;
    writeFile(other / "idcode.lst", P + " 6 1 2 OTHERDIR\n");
    writeFile(env.dataDir() / "idcode.lst", P + " 6 1 2 DEFAULTDIR\n");
    const std::pair<std::string, std::string> cases[] = {
        {"", "DEFAULTDIR"}, {other.str(), "OTHERDIR"}, {other.str() + "/", "OTHERDIR"}};
    for (const auto& [dir, expected] : cases) {
        const unsigned h = create({"datadir=" + dir});
        ASSERT_NE(nullptr, JexRT::findSession(h)) << dir;
        std::string name, bypass;
        unsigned ir = 0;
        EXPECT_EQ(JEX_SUCCESS, JexRT::idcodeLookup(h, 0x0A001093u, name, &ir, nullptr, nullptr, bypass, nullptr));
        EXPECT_EQ(expected, name);
        EXPECT_EQ("111111", bypass);
        // No IR length asked for: no BYPASS text.
        JexRT::idcodeLookup(h, 0x0A001093u, name, nullptr, nullptr, nullptr, bypass, nullptr);
        EXPECT_EQ("", bypass);
        JexRT::destroySession(h);
        if (!dir.empty()) {
            EXPECT_EQ(other.str() + "/", Jex_Util::getDataDirPath());
        }
    }
}

TEST(StaticAcdRead, KeysOccurrencesAndPlaces)
{
    TempDir dir;
    writeFile(dir / "sub/x.acd", "; comment\n  KEY = first \nKEY=second\nK.S=sub\n\n");
    const std::string list = (dir / "sub/x.lst").string();
    StaticAcdRead beside(list.c_str(), nullptr, nullptr, 1, 0, 1);
    ASSERT_TRUE(beside.IsValid());
    EXPECT_EQ((dir / "sub/x.acd").string(), beside.getlocation());
    EXPECT_EQ(" first ", beside.GetStringByKey("KEY", nullptr, 0, nullptr, 0));
    EXPECT_EQ("second", beside.GetStringByKey("KEY", nullptr, 1, nullptr, 0));
    EXPECT_EQ("dflt", beside.GetStringByKey("KEY", nullptr, 2, "dflt", 0));
    EXPECT_EQ("sub", beside.GetStringByKey("K", "S", 0, nullptr, 0));
    EXPECT_EQ("", beside.GetStringByKey("key", nullptr, 0, nullptr, 0));

    const std::string elsewhere = (dir / "x.lst").string();
    EXPECT_FALSE(StaticAcdRead(elsewhere.c_str(), nullptr, nullptr, 1, 0, 1).IsValid());
    const std::vector<std::string> dirs = {(dir / "none").string(), (dir / "sub").string()};
    StaticAcdRead searched(elsewhere.c_str(), nullptr, &dirs, 1, 0, 1);
    EXPECT_TRUE(searched.IsValid());
    EXPECT_EQ((dir / "sub/x.acd").string(), searched.getlocation());

    EXPECT_EQ("a/b.c/name.acd", StaticAcdRead::dataFileNameFor("a/b.c/name"));
    EXPECT_EQ("a/name.acd", StaticAcdRead::dataFileNameFor("a/name.lst"));
    EXPECT_EQ("a/.hidden.acd", StaticAcdRead::dataFileNameFor("a/.hidden"));

    writeFile(dir / "loose.acd", "no equals sign\nKEY=v\n");
    const std::string loose = (dir / "loose.lst").string();
    EXPECT_FALSE(StaticAcdRead(loose.c_str(), nullptr, nullptr, 1, 0, 1).IsValid());
    EXPECT_EQ("v", StaticAcdRead(loose.c_str(), nullptr, nullptr, 1, 0, 0).GetStringByKey("KEY", nullptr, 0, nullptr, 0));
}
