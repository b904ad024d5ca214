// SPDX-License-Identifier: MIT
// The JSON writer: escaping and UTF-8 repair (the layout of whole documents
// shows in the program tests, which parse every --json output strictly).

#include <gtest/gtest.h>

#include <sstream>
#include <string>

#include "JsonWriter.hpp"
#include "MiniJson.hpp"

using jexjtag::cli::JsonWriter;

namespace {

std::string roundTrip(const std::string& text)
{
    std::ostringstream out;
    JsonWriter json(out);
    json.string(text);
    json.finish();
    return minijson::parse(out.str()).str(); // the reader insists on valid UTF-8
}

} // namespace

TEST(JsonWriterTest, EscapesQuotesBackslashesAndControls)
{
    EXPECT_EQ(R"("\"\\\b\f\n\r\t\u0000\u001f")", JsonWriter::quote(std::string("\"\\\b\f\n\r\t\0\x1f", 9)));
    EXPECT_EQ("\"\x7f~ \"", JsonWriter::quote("\x7f~ "));
    // Every byte value survives a round trip when it is valid text.
    std::string ascii;
    for (int c = 0; c < 0x80; ++c) ascii += static_cast<char>(c);
    EXPECT_EQ(ascii, roundTrip(ascii));
    // Keys are escaped too.
    std::ostringstream out;
    JsonWriter json(out);
    json.beginObject().key("k\"\n").string("v").endObject();
    json.finish();
    EXPECT_EQ("v", minijson::parse(out.str())["k\"\n"].str());
}

TEST(JsonWriterTest, ValidUtf8PassesAndInvalidBytesBecomeReplacementCharacters)
{
    const std::string valid = "Gr\xC3\xBC\xC3\x9F" "e \xE2\x82\xAC \xF0\x9F\x94\x8C";
    EXPECT_EQ(valid, roundTrip(valid));
    EXPECT_EQ("\"\\ufffd\"", JsonWriter::quote("\xFF"));
    // One replacement per byte that is not part of a valid sequence.
    const std::string r = "\\ufffd";
    EXPECT_EQ("\"a" + r + r + "b\"", JsonWriter::quote("a\xE2\x82" "b")); // cut sequence
    EXPECT_EQ("\"" + r + r + "\"", JsonWriter::quote("\xC0\xAF"));           // overlong '/'
    EXPECT_EQ("\"" + r + r + r + "\"", JsonWriter::quote("\xED\xA0\x80"));    // surrogate
    EXPECT_EQ("\"" + r + r + r + r + "\"", JsonWriter::quote("\xF4\x90\x80\x80")); // above U+10FFFF
    EXPECT_EQ("\"" + r + r + "\"", JsonWriter::quote("\xE2\x82"));           // cut at the end
    // Any byte soup gives valid JSON in valid UTF-8.
    std::string soup;
    for (int c = 0; c < 256; ++c) soup += static_cast<char>(c);
    EXPECT_NO_THROW(roundTrip(soup + soup));
}

