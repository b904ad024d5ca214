// SPDX-License-Identifier: MIT
// IDCODE list lines, the entry table's order and lookups, named files with
// their .acd data file.

#include <gtest/gtest.h>

#include <sstream>
#include <stdexcept>
#include <string>
#include <type_traits>
#include <utility>
#include <vector>

#include "jexjtag/rt/Jex_DeviceData.hpp"
#include "support/TestSupport.hpp"

using JexRT::Jex_DeviceData;
using JexRT::Jex_OneDeviceData;
using testsupport::TempDir;
using testsupport::writeFile;

namespace {

const std::string kDevA = "0000_1010_0000_0000_0001_0000_1001_0011"; // 0x0A001093
const std::string P = "00001010000000000001000010010011";           // the same without '_'

void read(Jex_DeviceData& table, const std::string& text, bool user = false)
{
    std::istringstream in(text);
    table.addEntriesFromFile("test.lst", in, user);
}

// The message of the error that f throws, or "" when it throws none.
template <class F>
std::string thrown(F&& f)
{
    try {
        f();
    } catch (const std::logic_error& e) {
        return e.what();
    }
    return "";
}

std::string errorOf(const std::string& text)
{
    Jex_DeviceData table;
    return thrown([&] { read(table, text); });
}

std::string lineError(int line, const std::string& reason)
{
    return "Input error in file: test.lst line:" + std::to_string(line) + " - " + reason;
}

} // namespace

static_assert(!std::is_copy_constructible_v<Jex_DeviceData> && !std::is_copy_assignable_v<Jex_DeviceData>,
              "a table owns its entries");

TEST(DeviceDataLines, AFullLineGivesOneEntry)
{
    Jex_DeviceData table;
    read(table, kDevA + " 6 1 2 DEVA\n" + "1" + P.substr(1) + " 4096 2147483647 0 BIG\n");
    const Jex_OneDeviceData* e = table.findByIdcode(0x0A001093);
    ASSERT_NE(nullptr, e);
    EXPECT_EQ(P, e->getMatchText());
    EXPECT_EQ("DEVA", e->getName());
    EXPECT_EQ(6, e->getIRLength());
    EXPECT_EQ(1, e->getFamilyType());
    EXPECT_EQ(2, e->getSubType());
    EXPECT_FALSE(e->isUserEntry());
    EXPECT_EQ(0xFFFFFFFFu, e->getNonXMask());
    EXPECT_EQ(0x093u, e->getMfg());
    EXPECT_FALSE(e->isMatch(0x1A001093));
    // The largest numbers: IR length 4096 (longer is bad data), family 2^31 - 1.
    EXPECT_EQ(4096, table.getIRLength(static_cast<int>(0x8A001093u)));
    int family = -1;
    table.getFamilyTypeByIdcode(static_cast<int>(0x8A001093u), &family, nullptr);
    EXPECT_EQ(2147483647, family);
}

TEST(DeviceDataLines, DontCareBitsAndCommas)
{
    Jex_DeviceData table;
    read(table, "XXXX" + kDevA.substr(4) + ",6,1,2,DEVA\n" + "xxxx" + P.substr(4) + "\t7 0 0 LOWER\n", true);
    ASSERT_EQ(2u, table.getEntryCount());
    for (size_t i : {0u, 1u}) {
        EXPECT_EQ(0x0FFFFFFFu, table.getEntry(i).getNonXMask());
        EXPECT_TRUE(table.getEntry(i).isMatch(static_cast<int>(0xFA001093u)));
        EXPECT_TRUE(table.getEntry(i).isUserEntry());
    }
    EXPECT_EQ("DEVA", table.getEntry(0).getName());
    EXPECT_EQ("xxxx" + P.substr(4), table.getEntry(1).getMatchText()); // kept as written
}

TEST(DeviceDataLines, NamesCommentsBlankLinesAndLineEnds)
{
    const std::pair<std::string, std::vector<std::string>> cases[] = {
        {P + " 6 1 2 DEV,REV2 more words\n", {"DEV,REV2"}},
        {P + " 6 1 2 DEVB#note\n", {"DEVB"}},
        {P + " 6 1 2 DEVC   # a comment\n", {"DEVC"}},
        {"\n# comment\n   \t \n  # indented comment\n____\n,,,,\n\r\n", {}},
        {P + " 6 1 2 DEVA\r\n# c\r\n" + "1" + P.substr(1) + ",4,0,0,DEVB\r\n", {"DEVA", "DEVB"}},
    };
    for (const auto& [text, names] : cases) {
        Jex_DeviceData table;
        read(table, text);
        std::vector<std::string> got;
        for (size_t i = 0; i < table.getEntryCount(); ++i) got.push_back(table.getEntry(i).getName());
        EXPECT_EQ(names, got) << text;
    }
}

TEST(DeviceDataLines, BadLinesGiveTheirMessage)
{
    const std::vector<std::pair<std::string, std::string>> cases = {
        {P.substr(1) + " 6 1 2 DEVA", "bad data."},                 // 31 characters
        {P + "0 6 1 2 DEVA", "bad data."},                          // 33 characters
        {P + " 6 1 2 D", "bad data."},                              // one-character name
        {P + " 6 1", "bad data."},                                  // ends after the family type
        {P + " 6 1 DEVA", "non-digit character in sub type."},      // sub type left out
        {P + " 6 1 2 #note", "bad data."},                          // empty name
        {P + " 6 1 2 # note", "bad data."},
        {"0001#", "bad data."},                                     // '#' inside the pattern
        {"0001 # 6 1 2 DEVA", "non-digit character in register length."},
        {P.substr(0, 10) + "Z" + P.substr(11) + " 6 1 2 DEVA", "invalid character in idcode."},
        {P + " 6a 1 2 DEVA", "non-digit character in register length."},
        {P + " 6 -1 2 DEVA", "non-digit character in family type."},
        {P + " 6 1 2x DEVA", "non-digit character in sub type."},
        {"_ 6 1 2 DEVA", "bad data."},                              // no pattern
        {P + " 2147483648 1 2 DEVA", "bad data."},                  // too large for the field
        {P + " 6 99999999999999999999 2 DEVA", "bad data."},
        {P + " 6 1 4294967296 DEVA", "bad data."},
        // The first fault from the left decides.
        {P.substr(1) + " 6x 1 2 D", "non-digit character in register length."},
    };
    for (const auto& [line, reason] : cases) EXPECT_EQ(lineError(0, reason), errorOf(line)) << line;
}

TEST(DeviceDataLines, LinesAreNumberedFromZeroCountingEveryLine)
{
    EXPECT_EQ(lineError(0, "bad data."), errorOf("x\n"));
    EXPECT_EQ(lineError(2, "bad data."), errorOf(P + " 6 1 2 DEVA\n\nx\n"));
    EXPECT_EQ(lineError(3, "invalid character in idcode."), errorOf("# c\n\n   \nZ\n"));
    // A last line without a line end counts.
    EXPECT_EQ(lineError(1, "bad data."), errorOf("\n" + P + " 6 1 2"));
}

TEST(DeviceDataOrder, ConcreteBitBeforeDontCare)
{
    Jex_DeviceData table;
    // Read in the "wrong" order: the sort decides.
    read(table, "XXXX0000" + std::string(24, '1') + " 5 0 0 SECOND\n");
    read(table, "0000XXXX" + std::string(24, '1') + " 4 0 0 FIRST\n");
    read(table, std::string(32, 'X') + " 2 0 0 ANY\n");
    EXPECT_EQ("FIRST", table.getDeviceName(0x00FFFFFF)); // both match: the first wins
    EXPECT_EQ("SECOND", table.getDeviceName(0x10FFFFFF));
    EXPECT_EQ("ANY", table.getDeviceName(0x11111111));
    EXPECT_EQ("ANY", table.getEntry(2).getName());
}

TEST(DeviceDataErrors, EntryConstructorRejectsWrongPatterns)
{
    EXPECT_THROW(Jex_OneDeviceData("0101", "DEV", 1, 0, 0, false), std::invalid_argument);
    EXPECT_THROW(Jex_OneDeviceData(std::string(31, '0') + "2", "DEV", 1, 0, 0, false), std::invalid_argument);
    const Jex_OneDeviceData ok(std::string(31, 'x') + "1", "DEV", 1, 0, 0, true);
    EXPECT_EQ(1u, ok.getNonXMask());
    EXPECT_EQ(1u, ok.getMfg());
    EXPECT_EQ(P, Jex_OneDeviceData::intIdcodeToString(0x0A001093));
    EXPECT_EQ(std::string(32, '1'), Jex_OneDeviceData::intIdcodeToString(-1));
}

TEST(DeviceDataFiles, NamedFileAndItsDataFile)
{
    TempDir dir;
    const std::string list = (dir / "chips.lst").string();
    writeFile(list, P + " 6 1 2 FROMLIST\n");
    writeFile(dir / "chips.acd", "# data file\nOTHER=1\nIDCODELIST=" + std::string(32, '1') + " 4 0 0 FROMACD:" +
                                     "1" + P.substr(1) + ",5,0,0,ACD2\r\n");
    Jex_DeviceData table;
    table.addEntriesFromFile(list.c_str(), true);
    ASSERT_EQ(3u, table.getEntryCount());
    EXPECT_EQ("FROMLIST", table.getDeviceName(0x0A001093));
    EXPECT_EQ("FROMACD", table.getDeviceName(-1));
    EXPECT_EQ("ACD2", table.getDeviceName(static_cast<int>(0x8A001093u)));
    EXPECT_TRUE(table.getEntry(2).isUserEntry());
}

TEST(DeviceDataFiles, ErrorsNameTheFileTheyCameFrom)
{
    TempDir dir;
    Jex_DeviceData table;
    const auto errorReading = [](Jex_DeviceData& t, const std::string& path) {
        return thrown([&] { t.addEntriesFromFile(path.c_str(), false); });
    };
    const std::string missing = (dir / "none.lst").string();
    EXPECT_EQ("Error: Unable to open " + missing, errorReading(table, missing));
    EXPECT_NE("", errorReading(table, dir.str())); // a directory

    const std::string list = (dir / "chips.lst").string();
    writeFile(list, P + " 6 1 2 FROMLIST\n");
    writeFile(dir / "chips.acd", "IDCODELIST=" + P + " 6 1 2 OK:" + P + " 6 1 2 X\n");
    EXPECT_EQ("Input error in file: " + (dir / "chips.acd").string() + " line:1 - bad data.",
              errorReading(table, list));
    EXPECT_EQ(2u, table.getEntryCount()); // FROMLIST and OK stay

    // A bad line in the list itself: the data file is not read.
    Jex_DeviceData other;
    writeFile(list, P + " 6 1 2 FIRST\nbad\n");
    EXPECT_NE("", errorReading(other, list));
    EXPECT_EQ(1u, other.getEntryCount());
}

TEST(DeviceDataFiles, MissingOrInvalidDataFilesAreSkipped)
{
    TempDir dir;
    const std::string list = (dir / "chips.lst").string();
    writeFile(list, P + " 6 1 2 FROMLIST\n");
    Jex_DeviceData table;
    const std::pair<const char*, size_t> steps[] = {
        {nullptr, 1u}, // no data file
        {"not a key value line\nIDCODELIST=11111111111111111111111111111111 4 0 0 IGNORED\n", 2u},
        {"OTHER=x\nIDCODELIST=\n", 3u},
    };
    for (const auto& [acd, count] : steps) {
        if (acd) writeFile(dir / "chips.acd", acd);
        table.addEntriesFromFile(list.c_str(), false);
        EXPECT_EQ(count, table.getEntryCount()) << (acd ? acd : "");
    }
    EXPECT_EQ("", table.getDeviceName(-1));
}
