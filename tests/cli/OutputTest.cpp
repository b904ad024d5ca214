// SPDX-License-Identifier: MIT
// Output corners the program run end to end does not reach: odd plug-in
// values, unterminated record fields, and the message prefixes.

#include <gtest/gtest.h>

#include <cstring>
#include <memory>
#include <sstream>
#include <string>

#include "InfoOutput.hpp"
#include "MessageSink.hpp"
#include "MiniJson.hpp"
#include "ScanOutput.hpp"
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

TEST(ScanOutputTest, NegativeIRLengthFromThePluginIsUnknown)
{
    ScanResult r = twoDeviceChain();
    r.devices[1].irLength = static_cast<unsigned>(-1);
    EXPECT_NE(std::string::npos, textOf(writeScanText, r).find("  1  0x12345678  unknown  (unknown)\n"))
        << textOf(writeScanText, r);
    EXPECT_TRUE(jsonOf(writeScanJson, r)["devices"][1]["ir_length"].isNull());
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

