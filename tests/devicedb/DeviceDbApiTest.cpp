// SPDX-License-Identifier: MIT
// The device database as a host sees it: the exported JexJtag_db_*
// functions and the JexRT lookups.

#include <gtest/gtest.h>

#include <cstring>
#include <filesystem>
#include <sstream>
#include <string>
#include <vector>

#include "jexjtag/JexRT.hpp"
#include "support/TestSupport.hpp"

using testsupport::IsolatedEnvironment;
using testsupport::LogCapture;
using testsupport::writeFile;

namespace {

// A few real devices, as an installation list would hold them.
const char* const kInstalledList =
    "# pattern                            IR fam sub name\n"
    "XXXX0001010000010100000010010011      6  1   0  XC3S200\n"
    "XXXX_0011_0110_0010_1101_0000_1001_0011 6 1 1 XC7A35T\n"
    "XXXX0010000010100001000011011101,10,2,0,EPM240\n"
    "XXXX1011101000000000010001110111  4  3   0  ARM_CORTEX_DAP   # SWJ-DP\n"
    "\n";

const char* const kXc3s200 = "00000001010000010100000010010011"; // 0x01414093
const char* const kEpm240 = "00000010000010100001000011011101";  // 0x020A10DD

class DeviceDbApiTest : public ::testing::Test {
protected:
    void SetUp() override
    {
        writeFile(env.dataDir() / "idcode.lst", kInstalledList);
        // "datadir" is process-wide: name it, whatever an earlier test left.
        const std::string dataDir = "datadir=" + env.dataDir().string();
        const char* argv[] = {dataDir.c_str()};
        ASSERT_EQ(JEX_SUCCESS, JexJtag_session_create(nullptr, 1, argv, &handle));
    }
    void TearDown() override { JexJtag_session_destroy(handle); }
    unsigned add(const std::string& text, const char* name = "host.lst")
    {
        return JexJtag_db_addDeviceData(handle, name, text.data(), static_cast<unsigned>(text.size()));
    }
    // JexJtag_db_lookupDevice into buffers filled with 'z'; the raw buffers are kept.
    struct Result {
        unsigned status;
        std::string name; // up to the first NUL
        unsigned irlen;
        std::string bypass;
        std::string rawName, rawBypass;
    };
    Result lookup(const char* idcode, unsigned h = kNone)
    {
        char name[24], bypass[24];
        std::memset(name, 'z', sizeof name);
        std::memset(bypass, 'z', sizeof bypass);
        unsigned irlen = 77;
        const unsigned status = JexJtag_db_lookupDevice(h == kNone ? handle : h, idcode, name, sizeof name, &irlen,
                                                        bypass, sizeof bypass);
        return {status, std::string(name, strnlen(name, sizeof name)), irlen,
                std::string(bypass, strnlen(bypass, sizeof bypass)), std::string(name, sizeof name),
                std::string(bypass, sizeof bypass)};
    }

    static constexpr unsigned kNone = 0xFFFFFFFFu;
    IsolatedEnvironment env;
    unsigned handle = kNone;
};

} // namespace

// Single lookups of the installation's devices through each exported
// function are in TextsAreCutToTheirBuffers and TraceLines.
TEST_F(DeviceDbApiTest, DevicesAreFoundByTheirIdcodeText)
{
    Result r = lookup(kXc3s200);
    EXPECT_EQ(JEX_SUCCESS, r.status);
    EXPECT_EQ("XC3S200", r.name);
    EXPECT_EQ(6u, r.irlen);
    EXPECT_EQ("111111", r.bypass);

    r = lookup("0100" "1011101000000000010001110111"); // version 4: the don't-care bits
    EXPECT_EQ("ARM_CORTEX_DAP", r.name);
    EXPECT_EQ("1111", r.bypass);

    // A short text counts as having leading zeros; the number form agrees.
    EXPECT_EQ(JEX_SUCCESS, add("00000000000000000000000000000101 3 0 0 FIVE\n"));
    EXPECT_EQ("FIVE", lookup("101").name);
    std::string found, bits;
    EXPECT_EQ(JEX_SUCCESS, JexRT::idcodeLookup(handle, 0x020A10DDu, found, nullptr, nullptr, nullptr, bits, nullptr));
    EXPECT_EQ("EPM240", found);
}

TEST_F(DeviceDbApiTest, HostListWinsOverTheInstallationsForTheSamePattern)
{
    EXPECT_EQ(JEX_SUCCESS, add("XXXX0001010000010100000010010011 8 5 6 MY_XC3S200\n"));
    EXPECT_EQ("MY_XC3S200", lookup(kXc3s200).name);

    std::string name, bypass;
    unsigned ir = 0, family = 0, sub = 0;
    bool user = false;
    EXPECT_EQ(JEX_SUCCESS, JexRT::idcodeLookup(handle, std::string(kXc3s200), name, &ir, &family, &sub, bypass, &user));
    EXPECT_EQ("MY_XC3S200/8/5/6/1/11111111", name + "/" + std::to_string(ir) + "/" + std::to_string(family) + "/" +
                                                 std::to_string(sub) + "/" + std::to_string(user) + "/" + bypass);
    EXPECT_EQ(JEX_SUCCESS, JexRT::idcodeLookup(handle, std::string(kEpm240), name, &ir, &family, &sub, bypass, &user));
    EXPECT_EQ("EPM240", name);
    EXPECT_FALSE(user);

    std::istringstream more("XXXX0010000010100001000011011101 12 0 0 MY_EPM240\n");
    EXPECT_EQ(JEX_SUCCESS, JexRT::addDeviceData(handle, "stream.lst", more));
    EXPECT_EQ("MY_EPM240", lookup(kEpm240).name);
    std::istringstream none("");
    EXPECT_EQ(JEX_FAILURE, JexRT::addDeviceData(0x00770000u, "stream.lst", none));
}

TEST_F(DeviceDbApiTest, BadLineFailsAndKeepsTheLinesBeforeIt)
{
    LogCapture log(2);
    const std::string text = "00000000000000000000000000000001 3 0 0 ONE\n"
                             "0000000000000000000000000000001 3 0 0 SHORT\n"
                             "00000000000000000000000000000011 3 0 0 NEVER\n";
    EXPECT_EQ(JEX_FAILURE, add(text, "mine.lst"));
    EXPECT_TRUE(log.has("*** EXCEPTION: Input error in file: mine.lst line:1 - bad data.\n"));
    EXPECT_EQ("ONE", lookup("1").name);
    EXPECT_EQ("", lookup("11").name);
    EXPECT_EQ("XC3S200", lookup(kXc3s200).name); // the installation's entries are all there

    // Only bufsize bytes are read, an embedded NUL included.
    const std::string two = "00000000000000000000000000000010 3 0 0 TWO\n";
    const std::string three = "00000000000000000000000000000011 3 0 0 THREE\n";
    EXPECT_EQ(JEX_SUCCESS, JexJtag_db_addDeviceData(handle, "cut.lst", (three + two).data(), unsigned(three.size())));
    EXPECT_EQ("THREE", lookup("11").name);
    EXPECT_EQ("", lookup("10").name);
    EXPECT_EQ(JEX_FAILURE, add(two + std::string(1, '\0') + "01\n"));
    EXPECT_EQ("TWO", lookup("10").name);

    EXPECT_EQ(JEX_SUCCESS, JexJtag_db_addDeviceData(handle, "empty.lst", nullptr, 0));
    EXPECT_EQ(JEX_FAILURE, JexJtag_db_addDeviceData(handle, "null.lst", nullptr, 5));
    EXPECT_EQ(JEX_FAILURE, JexJtag_db_addDeviceData(handle, nullptr, "", 0));
    EXPECT_EQ(JEX_FAILURE, JexJtag_db_addDeviceData(0x00770000u, "x.lst", "", 0));
}

TEST_F(DeviceDbApiTest, ListOrderLimitsAndIdcodeTexts)
{
    // Entries kept before a bad line are sorted in: the exact pattern wins
    // over the installation's don't-care one.
    EXPECT_EQ(JEX_FAILURE, add("00000001010000010100000010010011 8 0 0 EXACT\nbad\n"));
    EXPECT_EQ("EXACT", lookup(kXc3s200).name);
    // 'x' sorts as 'X': the host's entry wins over the installation's.
    EXPECT_EQ(JEX_SUCCESS, add("xxxx0010000010100001000011011101 10 0 0 LOWER\n"));
    EXPECT_EQ("LOWER", lookup(kEpm240).name);
    // An IR length above 4096 is bad data.
    LogCapture log(2);
    EXPECT_EQ(JEX_FAILURE, add("00000000000000000000000000000111 2000000000 0 0 HUGE\n", "huge.lst"));
    EXPECT_TRUE(log.has("*** EXCEPTION: Input error in file: huge.lst line:0 - bad data.\n"));
    EXPECT_EQ(JEX_SUCCESS, add("00000000000000000000000000000111 4096 0 0 BIG\n"));
    // Only 1 to 32 characters of 0, 1, X and x are IDCODE texts.
    for (const char* text : {"0x0362D093", "", "000000000000000000000000000000011"})
        EXPECT_EQ(JEX_FAILURE, lookup(text).status) << text;
}

TEST_F(DeviceDbApiTest, TextsAreCutToTheirBuffers)
{
    EXPECT_EQ(JEX_SUCCESS, add("00000000000000000000000000000111 40 0 0 WIDE_IR_DEVICE\n"));
    char bypass[64];
    EXPECT_EQ(JEX_SUCCESS, JexJtag_db_getBypassForIdcode(handle, "111", bypass, 41));
    EXPECT_EQ(std::string(40, '1'), bypass);
    std::memset(bypass, 'z', sizeof bypass);
    EXPECT_EQ(JEX_SUCCESS, JexJtag_db_getBypassForIdcode(handle, "111", bypass, 33));
    EXPECT_EQ(std::string(32, '1'), bypass);
    EXPECT_EQ('z', bypass[33]); // nothing beyond the buffer size

    char name[8];
    std::memset(name, 'z', sizeof name);
    EXPECT_EQ(JEX_SUCCESS, JexJtag_db_getDeviceNameForIdcode(handle, kXc3s200, name, 4));
    EXPECT_EQ(std::string("XC3\0zzzz", 8), std::string(name, 8));
    std::memset(name, 'z', sizeof name);
    EXPECT_EQ(JEX_SUCCESS, JexJtag_db_getDeviceNameForIdcode(handle, kEpm240, name, 8));
    EXPECT_EQ(std::string("EPM240\0\0", 8), std::string(name, 8)); // padded with NUL bytes
    EXPECT_EQ(JEX_SUCCESS, JexJtag_db_getDeviceNameForIdcode(handle, kEpm240, name, 1));
    EXPECT_EQ('\0', name[0]);
}

TEST_F(DeviceDbApiTest, UnknownCodeClearsTheOutputsAFailureFillsBypassWithFF)
{
    Result r = lookup("1");
    EXPECT_EQ(JEX_SUCCESS, r.status);
    EXPECT_EQ(std::string(24, '\0'), r.rawName);
    EXPECT_EQ(0u, r.irlen);
    EXPECT_EQ(std::string(24, '\0'), r.rawBypass);

    r = lookup(kXc3s200, 0x00770000u);
    EXPECT_EQ(JEX_FAILURE, r.status);
    EXPECT_EQ(std::string(24, '\0'), r.rawName);
    EXPECT_EQ(0u, r.irlen);
    EXPECT_EQ(std::string(24, '\xFF'), r.rawBypass);

    char name[8];
    char bypass[8];
    std::memset(bypass, 'z', sizeof bypass);
    EXPECT_EQ(JEX_FAILURE, JexJtag_db_getBypassForIdcode(0x00770000u, kXc3s200, bypass, 5));
    EXPECT_EQ(std::string(5, '\xFF') + "zzz", std::string(bypass, sizeof bypass));
    unsigned irlen = 77;
    EXPECT_EQ(JEX_FAILURE, JexJtag_db_getIRLengthForIdcode(0x00770000u, kXc3s200, &irlen));
    EXPECT_EQ(0u, irlen);

    // Null or unusable arguments fail cleanly.
    irlen = 77;
    EXPECT_EQ(JEX_FAILURE, JexJtag_db_lookupDevice(handle, nullptr, name, sizeof name, &irlen, bypass, sizeof bypass));
    EXPECT_EQ(0u, irlen);
    EXPECT_EQ(JEX_FAILURE, JexJtag_db_getDeviceNameForIdcode(handle, kXc3s200, name, 0));
    EXPECT_EQ(JEX_FAILURE, JexJtag_db_getBypassForIdcode(handle, kXc3s200, bypass, 0));
    EXPECT_EQ(JEX_SUCCESS, JexJtag_db_getIRLengthForIdcode(handle, kXc3s200, nullptr));
    EXPECT_EQ(JEX_SUCCESS, JexJtag_db_lookupDevice(handle, kXc3s200, nullptr, 0, nullptr, nullptr, 0));

    std::string text = "kept", bits = "kept";
    unsigned ir = 5;
    EXPECT_EQ(JEX_FAILURE, JexRT::idcodeLookup(0x00770000u, 1u, text, &ir, nullptr, nullptr, bits, nullptr));
    EXPECT_EQ("kept", text);
    EXPECT_EQ(5u, ir);
}

TEST(DeviceDbSessionCreation, MissingListFailsAndEmptyListGivesAnEmptyDatabase)
{
    IsolatedEnvironment env;
    std::filesystem::remove(env.dataDir() / "idcode.lst");
    LogCapture log(1);
    unsigned handle = 99;
    // "datadir" (process-wide), given with a trailing separator.
    const std::string arg = "datadir=" + env.home().string() + "/";
    const char* argv[] = {arg.c_str()};
    EXPECT_EQ(JEX_FAILURE, JexJtag_session_create(nullptr, 1, argv, &handle));
    EXPECT_EQ(0u, handle);
    EXPECT_TRUE(log.has("\nError: Unable to open " + env.home().string() + "/idcode.lst\n")) << log.text();

    writeFile(env.dataDir() / "idcode.lst", "");
    const std::string dataDir = "datadir=" + env.dataDir().string();
    argv[0] = dataDir.c_str();
    ASSERT_EQ(JEX_SUCCESS, JexJtag_session_create(nullptr, 1, argv, &handle));
    char name[16] = "x";
    unsigned irlen = 5;
    EXPECT_EQ(JEX_SUCCESS, JexJtag_db_getDeviceNameForIdcode(handle, kXc3s200, name, sizeof name));
    EXPECT_STREQ("", name);
    EXPECT_EQ(JEX_SUCCESS, JexJtag_db_getIRLengthForIdcode(handle, "0", &irlen));
    EXPECT_EQ(0u, irlen);
    JexJtag_session_destroy(handle);
}

// The build's own idcode.lst, which IsolatedEnvironment copies in.
TEST(DeviceDbShippedList, HoldsRealDevices)
{
    IsolatedEnvironment env;
    unsigned handle = 0;
    const std::string dataDir = "datadir=" + env.dataDir().string();
    const char* argv[] = {dataDir.c_str()};
    ASSERT_EQ(JEX_SUCCESS, JexJtag_session_create(nullptr, 1, argv, &handle));
    char name[64];
    char bypass[64];
    unsigned irlen = 0;
    ASSERT_EQ(JEX_SUCCESS, JexJtag_db_lookupDevice(handle, "00010011011000101101000010010011", name, sizeof name,
                                                   &irlen, bypass, sizeof bypass)); // 0x1362D093, version 1
    EXPECT_STREQ("XC7A35T", name);
    EXPECT_EQ(6u, irlen);
    EXPECT_STREQ("111111", bypass);
    EXPECT_EQ(JEX_SUCCESS, JexJtag_db_getDeviceNameForIdcode(handle, kXc3s200, name, sizeof name));
    EXPECT_STREQ("XC3S200", name);
    JexJtag_session_destroy(handle);
}
