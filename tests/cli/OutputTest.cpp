// SPDX-License-Identifier: MIT
// What each command prints, as text and as JSON, and how library messages
// and help texts look.

#include <gtest/gtest.h>

#include <cstring>
#include <memory>
#include <sstream>
#include <string>

#include "BsdlOutput.hpp"
#include "HelpText.hpp"
#include "InfoOutput.hpp"
#include "LookupOutput.hpp"
#include "MessageSink.hpp"
#include "MiniJson.hpp"
#include "ScanOutput.hpp"
#include "ShiftOutput.hpp"
#include "TargetsOutput.hpp"
#include "jexjtag/types.h"

using namespace jexjtag::cli;

namespace {

ScanResult twoDeviceChain()
{
    ScanResult r;
    r.target = "jtag_sim";
    r.devices.push_back({0, "01001011101000000000010001110111", 4, "ARM CoreSight JTAG-DP", "database", ""});
    r.devices.push_back({1, "00010010001101000101011001111000", 0, "", "unknown", ""});
    return r;
}

template <typename Result>
std::string textOf(void (*write)(std::ostream&, const Result&), const Result& result)
{
    std::ostringstream out;
    write(out, result);
    return out.str();
}

template <typename Result>
minijson::Value jsonOf(void (*write)(std::ostream&, const Result&), const Result& result)
{
    return minijson::parse(textOf(write, result));
}

} // namespace

TEST(ScanOutputTest, TableListsEveryDeviceNearestTdoFirst)
{
    EXPECT_EQ("jtag_sim: 2 devices (device 0 is nearest TDO)\n"
              "  #  IDCODE      IR  DEVICE\n"
              "  0  0x4BA00477   4  ARM CoreSight JTAG-DP\n"
              "  1  0x12345678   0  (unknown)\n",
              textOf(writeScanText, twoDeviceChain()));
    ScanResult none;
    none.target = "jtag_sim";
    EXPECT_EQ("jtag_sim: no devices found\n", textOf(writeScanText, none));
    ScanResult one = twoDeviceChain();
    one.devices.resize(1);
    EXPECT_EQ(0u, textOf(writeScanText, one).find("jtag_sim: 1 device (device 0"));
}

TEST(ScanOutputTest, NegativeIRLengthFromThePluginIsUnknown)
{
    ScanResult r = twoDeviceChain();
    r.devices[1].irLength = static_cast<unsigned>(-1);
    EXPECT_NE(std::string::npos, textOf(writeScanText, r).find("  1  0x12345678  unknown  (unknown)\n"))
        << textOf(writeScanText, r);
    EXPECT_TRUE(jsonOf(writeScanJson, r)["devices"][1]["ir_length"].isNull());
}

TEST(TargetsOutputTest, TextAndJsonWithAndWithoutDescriptors)
{
    TargetsResult r;
    r.targets.push_back({0, "jtag_sim", "jtag_sim", "<JexPlugin><targetname>jtag_sim</targetname></JexPlugin>"});
    r.targets.push_back({1, "other_cable", "multi", "<x/>\n"});
    EXPECT_EQ("2 targets:\n"
              "  #  TARGET       PLUGIN\n"
              "  0  jtag_sim     jtag_sim\n"
              "  1  other_cable  multi\n",
              textOf(writeTargetsText, r));
    EXPECT_FALSE(jsonOf(writeTargetsJson, r)["targets"][0].has("xml"));

    r.withXml = true;
    const std::string text = textOf(writeTargetsText, r);
    EXPECT_NE(std::string::npos,
              text.find("--- jtag_sim (jtag_sim) ---\n<JexPlugin><targetname>jtag_sim</targetname></JexPlugin>\n"));
    EXPECT_NE(std::string::npos, text.find("--- other_cable (multi) ---\n<x/>\n"));
    const minijson::Value doc = jsonOf(writeTargetsJson, r);
    EXPECT_EQ(2u, doc["count"].uint());
    EXPECT_EQ("other_cable", doc["targets"][1]["name"].str());
    EXPECT_EQ("multi", doc["targets"][1]["plugin"].str());
    EXPECT_EQ("<x/>\n", doc["targets"][1]["xml"].str());

    EXPECT_EQ("no targets: no plug-in is installed\n", textOf(writeTargetsText, TargetsResult{}));
    EXPECT_EQ(0u, jsonOf(writeTargetsJson, TargetsResult{})["count"].uint());
}

TEST(LookupOutputTest, UnknownDevicesSaySo)
{
    // A known device, and JSON of both kinds, are checked end to end in CliProgramTest.
    EXPECT_EQ("IDCODE  0x12345678\nDevice  (unknown: not in the device database)\n",
              textOf(writeLookupText, LookupResult{0x12345678u, "", 0, ""}));
}

TEST(BsdlOutputTest, IdcodeRegisterAsWrittenAndInHexWhenPlain)
{
    BsdlResult r{"dev.bsd", "XC7A35T_CSG324", 6, "00000011011000101101000010010011", "111111"};
    std::string text = textOf(writeBsdlText, r);
    EXPECT_NE(std::string::npos, text.find("IDCODE     00000011011000101101000010010011 (0x0362D093)\n"));
    EXPECT_NE(std::string::npos, text.find("Entity     XC7A35T_CSG324\n"));
    minijson::Value doc = jsonOf(writeBsdlJson, r);
    EXPECT_EQ("0x0362D093", doc["idcode_hex"].str());
    EXPECT_EQ(6u, doc["ir_length"].uint());
    EXPECT_EQ("111111", doc["bypass"].str());

    r.idcode = "XXXX0011011000101101000010010011";
    EXPECT_TRUE(jsonOf(writeBsdlJson, r)["idcode_hex"].isNull());
    r.idcode.clear();
    r.bypass.clear();
    text = textOf(writeBsdlText, r);
    EXPECT_NE(std::string::npos, text.find("IDCODE     (none)\n"));
    doc = jsonOf(writeBsdlJson, r);
    EXPECT_TRUE(doc["idcode"].isNull());
    EXPECT_TRUE(doc["bypass"].isNull());
}

TEST(ShiftOutputTest, AbsentDeviceDataAndInstructionAreNull)
{
    // A dr shift with --ir and a device is checked end to end in CliProgramTest.
    ShiftResult r;
    r.reg = "ir";
    r.exitState = JEXJTAG_PAUSE_IR;
    r.notation = DataNotation::Hex;
    r.tdo = BitVector(6);
    r.tdo.set(0, true);
    minijson::Value doc = jsonOf(writeShiftJson, r);
    EXPECT_TRUE(doc["device"].isNull());
    EXPECT_TRUE(doc["tdi"].isNull());
    EXPECT_TRUE(doc["instruction"].isNull());
    EXPECT_EQ("PAUSE_IR", doc["exit_state"].str());
    EXPECT_EQ("0x01", doc["tdo"].str());

    // The instruction keeps its own notation; text shows the dr shift's TDO only.
    BitVector instruction(4);
    instruction.set(0, true);
    r.instruction = ShiftResult::Instruction{DataNotation::PrefixedBinary, instruction, BitVector(4)};
    EXPECT_EQ("0x01\n", textOf(writeShiftText, r));
    doc = jsonOf(writeShiftJson, r);
    EXPECT_EQ("0b0001", doc["instruction"]["tdi"].str());
    EXPECT_EQ("0b0000", doc["instruction"]["tdo"].str());
}

TEST(InfoOutputTest, RecordFieldsAreReadWithinTheirBytes)
{
    auto info = std::make_unique<JexJtagTargetInfo>();
    std::strcpy(info->target_name, "jtag_sim");
    std::strcpy(info->vendor, "JexJtag \"sim\"");
    std::memset(info->rawinfo, 'r', sizeof info->rawinfo); // no NUL: read to the end of the field only
    info->target_flags = JEXJTAG_FLAG_NEW_FIRMWARE;

    InfoResult r;
    r.apiVersion = 0x10000;
    r.apiVersionText = "Version 1.0.0";
    r.targetType = "jtag_sim";
    r.fields = infoFields(*info);
    r.targetFlags = info->target_flags;
    ASSERT_EQ(11u, r.fields.size());
    EXPECT_EQ("target_name", r.fields[0].first);
    EXPECT_EQ("jtag_sim", r.fields[0].second);
    EXPECT_EQ("rawinfo", r.fields[10].first);
    EXPECT_EQ(std::string(JEXJTAG_INFO_TEXT_SIZE, 'r'), r.fields[10].second);

    const std::string text = textOf(writeInfoText, r);
    EXPECT_EQ(0u, text.find("api_version   0x10000 (Version 1.0.0)\n"
                            "target_type   jtag_sim\n"
                            "target_name   jtag_sim\n"));
    EXPECT_NE(std::string::npos, text.find("target_flags  0x1 (new firmware available)\n"));

    // api_version and new_firmware in JSON are checked end to end in CliProgramTest.
    const minijson::Value doc = jsonOf(writeInfoJson, r);
    EXPECT_EQ("JexJtag \"sim\"", doc["target"]["vendor"].str());
    EXPECT_EQ("", doc["target"]["port"].str());
    EXPECT_EQ(1u, doc["target"]["target_flags"].uint());
}

TEST(MessageSinkTest, PrefixByTypeAndOneLineEndEach)
{
    std::ostringstream out;
    MessageSink sink(out, false);
    sink.deliver(JEX_MSG_ERROR, "Could not obtain a BsdlReader\n");
    sink.deliver(JEX_MSG_WARNING, "careful");
    sink.deliver(JEX_MSG_STATUS, "opening\r\n");
    sink.deliver(JEX_MSG_INFO, nullptr);
    sink.deliver(JEX_MSG_NOISE, "hidden");
    sink.deliver(JEX_MSG_SILENT, "hidden");
    sink.deliver(7, "hidden");
    EXPECT_EQ("error: Could not obtain a BsdlReader\nwarning: careful\nstatus: opening\ninfo: \n", out.str());

    std::ostringstream verboseOut;
    MessageSink verbose(verboseOut, true);
    verbose.deliver(JEX_MSG_NOISE, "n");
    verbose.deliver(JEX_MSG_SILENT, "s");
    verbose.deliver(7, "d");
    verbose.deliver(JEX_MSG_ERROR, "two\nlines\n");
    EXPECT_EQ("noise: n\nsilent: s\ndebug(7): d\nerror: two\nlines\n", verboseOut.str());
}

TEST(HelpTextTest, TheOverviewListsTheTableInOrder)
{
    // A synopsis too wide for the column puts its summary on the next line.
    const Command shortOne{"ab", "ab X", "first", {}, 0, 0, nullptr, nullptr, nullptr, nullptr};
    const Command longOne{"cd", "cd --a-long-option", "second", {}, 0, 0, nullptr, nullptr, nullptr, nullptr};
    const std::string text = overviewText({&shortOne, &longOne});
    EXPECT_EQ(0u, text.find("Usage: jexjtag"));
    EXPECT_NE(std::string::npos,
              text.find("\nCommands:\n  ab X               first\n  cd --a-long-option\n                     second\n\n"))
        << text;
}
