// SPDX-License-Identifier: MIT
// The BSDL reader on good/wrong fixture pairs, odd but readable text and
// hostile inputs (vendor files are read through the C API in BsdlImportTest).

#include <gtest/gtest.h>

#include <filesystem>
#include <memory>
#include <string>
#include <vector>

#include "BsdlTestData.hpp"
#include "MessageRecorder.hpp"
#include "bsdl/BsdlDiagnostics.hpp"
#include "bsdl/BsdlReader.hpp"
#include "hostlayer/PortException.hpp"

namespace {

struct Release {
    void operator()(BsdlReader* r) const { r->removeReader(); }
};
using ReaderPtr = std::unique_ptr<BsdlReader, Release>;

std::wstring wide(const std::string& s) { return std::wstring(s.begin(), s.end()); }

std::string narrow(const std::wstring& s)
{
    std::string out;
    for (wchar_t c : s) out += (c > 0 && c < 0x80) ? static_cast<char>(c) : '?';
    return out;
}

// Reads a text; "" when it is accepted, else the exception's message.
std::wstring errorOf(const std::string& text, const char* name = "text.bsd")
{
    try {
        ReaderPtr reader(BsdlReader::CreateBsdlReaderFromBuffer(name, text.data(), text.size()));
        return reader ? L"" : L"(no reader)";
    } catch (const Port::Exception& e) {
        return e.getMessage();
    }
}

} // namespace

// Each wrong-NAME fixture differs in one place from its partner: good-NAME
// where that exists, else good.  The good one reads, the wrong one is
// refused with a message that names the file, the line and the problem.
struct FixturePair {
    const char* name;
    unsigned line; // 0: the message names no line
    const char* problem;
};

class BsdlFixturePair : public ::testing::TestWithParam<FixturePair> {};

TEST_P(BsdlFixturePair, GoodReadsAndWrongIsRefusedWithFileLineAndProblem)
{
    const FixturePair& pair = GetParam();
    MessageRecorder recorder;
    std::string good = kData + "/fixtures/good-" + pair.name + ".bsd";
    if (!std::filesystem::exists(good)) good = kData + "/fixtures/good.bsd";
    const std::string wrong = kData + "/fixtures/wrong-" + pair.name + ".bsd";

    ReaderPtr reader(BsdlReader::CreateBsdlReader(good.c_str()));
    ASSERT_TRUE(reader);
    EXPECT_STREQ("FIXTURE_DEV", reader->getCompName());
    EXPECT_EQ(4u, reader->getInstructionLength());
    EXPECT_STREQ("1111", reader->getInstructionOpcode("BYPASS"));
    EXPECT_STREQ("0000", reader->getInstructionOpcode("extest"));
    EXPECT_EQ(32u, std::string(reader->getIdcode()).size());
    EXPECT_TRUE(recorder.messages.empty()) << narrow(recorder.messages.front().second);

    std::wstring expected = wide("BSDL file '" + wrong + "'");
    if (pair.line) expected += wide(", line " + std::to_string(pair.line));
    expected += L": ";
    std::wstring message;
    try {
        ReaderPtr refused(BsdlReader::CreateBsdlReader(wrong.c_str()));
        EXPECT_FALSE(refused) << "accepted";
        // Not BSDL at all: no reader, and the reason goes out as an error.
        ASSERT_EQ(1u, recorder.of(Port_MsgMan::MSG_ERROR).size());
        message = recorder.of(Port_MsgMan::MSG_ERROR).front();
    } catch (const Port::Exception& e) {
        message = e.getMessage();
    }
    EXPECT_EQ(0u, message.find(expected)) << narrow(message);
    EXPECT_NE(std::wstring::npos, message.find(wide(pair.problem))) << narrow(message);
    EXPECT_EQ(L'\n', message.back());
}

INSTANTIATE_TEST_SUITE_P(
    Fixtures, BsdlFixturePair,
    ::testing::Values(FixturePair {"missing-entity", 0, "no entity declaration found"},
                      FixturePair {"unterminated-string", 32, "string literal is not closed"},
                      FixturePair {"zero-instruction-length", 28, "INSTRUCTION_LENGTH must be at least 1"},
                      FixturePair {"text-instruction-length", 28, "INSTRUCTION_LENGTH must be a positive integer"},
                      FixturePair {"huge-instruction-length", 28, "is larger than 4096"},
                      FixturePair {"missing-instruction-length", 0, "has no INSTRUCTION_LENGTH attribute"},
                      FixturePair {"short-idcode", 36, "IDCODE_REGISTER must have 32 bits, found 31"},
                      FixturePair {"idcode-bad-bit", 37, "IDCODE_REGISTER may hold only 0, 1 and X, found 'O'"},
                      FixturePair {"opcode-missing-paren", 31, "'(' expected after instruction EXTEST"},
                      FixturePair {"opcode-bad-bit", 32, "opcode of SAMPLE must be made of 0, 1 and X"},
                      FixturePair {"missing-semicolon", 36, "';' expected before 'attribute'"},
                      FixturePair {"unclosed-port", 13, "')' expected before 'use'"},
                      FixturePair {"missing-end", 53, "the file ends inside entity FIXTURE_DEV"},
                      FixturePair {"concat-not-string", 40,
                                   "a string literal after '&' in IDCODE_REGISTER expected, found '1'"},
                      FixturePair {"extra-paren", 26, "';' expected, found ')'"},
                      FixturePair {"stray-character", 45, "found the character '$'"},
                      FixturePair {"bad-use-clause", 14, "a name in use clause expected, found ';'"}),
    [](const ::testing::TestParamInfo<FixturePair>& param) {
        std::string n = param.param.name;
        for (char& c : n)
            if (c == '-') c = '_';
        return n;
    });

namespace {

// A minimal entity around the given attribute lines.
std::string entity(const std::string& body, const std::string& before = "", const std::string& eol = "\n")
{
    std::string text = before + "entity DEV is" + eol + "  generic (PHYSICAL_PIN_MAP : string := \"P\");" + eol +
                       "  port (TDI : in bit; TDO : out bit);" + eol + "  use STD_1149_1_2001.all;" + eol +
                       "  constant P : PIN_MAP_STRING := \"TDI:1, TDO:2\";" + eol + body + "end DEV;" + eol;
    return text;
}

const std::string kLength = "  attribute INSTRUCTION_LENGTH of DEV : entity is 2;\n";
const std::string kOpcode = "  attribute INSTRUCTION_OPCODE of DEV : entity is \"BYPASS (11)\";\n";

} // namespace

TEST(BsdlReaderText, OddButReadableTextGivesWarningsAndTheRightValues)
{
    struct Case {
        const char* what;
        std::string text;
        const char* idcode;
        const char* bypass;
        const wchar_t* warning;
    };
    const Case cases[] = {
        {"missing '&' between literals",
         entity(kLength + kOpcode + "  attribute IDCODE_REGISTER of DEV : entity is \"0000\" \"1111000011110000\"\n"
                                    "    & \"000011110001\";\n"),
         "00001111000011110000000011110001", "11", L"line 8: '&' missing between the string literals"},
        {"second IDCODE_REGISTER ignored",
         entity(kLength + kOpcode + "  attribute IDCODE_REGISTER of DEV : entity is \"0000000000000000000000000000000" "1\";\n"
                                    "  attribute IDCODE_REGISTER of DEV : entity is \"1111111111111111111111111111111" "1\";\n"),
         "00000000000000000000000000000001", "11", L"IDCODE_REGISTER is given again; the value of line 8 is kept"},
        {"repeated instruction",
         entity(kLength + "  attribute INSTRUCTION_OPCODE of DEV : entity is \"BYPASS (11), SAMPLE (01), bypass (10)\";\n"),
         "", "11", L"instruction bypass is declared again"},
        {"opcode length differs from INSTRUCTION_LENGTH",
         entity(kLength + "  attribute INSTRUCTION_OPCODE of DEV : entity is \"BYPASS (111)\";\n"), "", "111",
         L"opcode 111 of BYPASS has 3 bits, but INSTRUCTION_LENGTH is 2"},
        {"no BYPASS", entity(kLength + "  attribute INSTRUCTION_OPCODE of DEV : entity is \"EXTEST (00)\";\n"), "", "",
         L"declares no BYPASS instruction"},
        {"no INSTRUCTION_OPCODE", entity(kLength), "", "", L"has no INSTRUCTION_OPCODE attribute"},
        {"attribute for another entity",
         entity(kLength + "  attribute INSTRUCTION_OPCODE of OTHER : entity is \"BYPASS (11)\";\n"), "", "11",
         L"attribute INSTRUCTION_OPCODE is given for 'OTHER', but the entity is DEV"},
        {"IDCODE without its mandatory 1",
         entity(kLength + kOpcode + "  attribute IDCODE_REGISTER of DEV : entity is \"0000000000000000000000000000000" "0\";\n"),
         "00000000000000000000000000000000", "11", L"bit 0 of IDCODE_REGISTER is 0"},
        {"header line of a board-test program",
         entity(kLength + kOpcode, "!!!!   22    0    1 1578387469  Vf16e \"unclosed\n-- comment\n"), "", "11",
         L"line 1: text before the entity declaration is not BSDL"},
        {"text after the entity", entity(kLength + kOpcode) + "garbage \"here\n", "", "11",
         L"text after the end of entity DEV is ignored"},
        {"pin map named by the generic is missing",
         "entity DEV is\n generic (PHYSICAL_PIN_MAP : string := \"Q\");\n" + kLength + kOpcode + "end DEV;\n", "", "11",
         L"line 2: PHYSICAL_PIN_MAP 'Q' names no constant of this file"},
        {"statement that BSDL does not know",
         entity("  type T is (A, B);\n" + kLength + kOpcode), "", "11", L"statement 'type' is not part of BSDL"},
        {"pin-map name that is not a VHDL identifier",
         entity(kLength + kOpcode + "  constant PKG-B : PIN_MAP_STRING := \"TDI:1\";\n"), "", "11",
         L"constant name 'PKG-B' is not a VHDL identifier"},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.what);
        MessageRecorder recorder;
        ReaderPtr reader;
        try {
            reader.reset(BsdlReader::CreateBsdlReaderFromBuffer("odd.bsd", c.text.data(), c.text.size()));
        } catch (const Port::Exception& e) {
            FAIL() << narrow(e.getMessage());
        }
        ASSERT_TRUE(reader);
        EXPECT_STREQ("DEV", reader->getCompName());
        EXPECT_EQ(2u, reader->getInstructionLength());
        EXPECT_STREQ(c.idcode, reader->getIdcode());
        EXPECT_STREQ(c.bypass, reader->getInstructionOpcode("BYPASS"));
        EXPECT_TRUE(recorder.has(Port_MsgMan::MSG_WARNING, c.warning));
        EXPECT_EQ(1u, recorder.messages.size());
        EXPECT_TRUE(recorder.has(Port_MsgMan::MSG_WARNING, L"BSDL file 'odd.bsd'"));
    }
}

TEST(BsdlReaderText, VhdlLexicalDetails)
{
    MessageRecorder recorder;
    // A byte-order mark, doubled quotes inside a literal, extended identifiers, real numbers,
    // upper-case keywords, comments glued to tokens, a lone CR as a line end.
    const std::string text = "\xEF\xBB\xBF" // UTF-8 byte-order mark
                             "ENTITY \\odd name\\ IS\r"
                             "  ATTRIBUTE DESIGN_WARNING OF \\odd name\\ : ENTITY IS \"say \"\"hi\"\"\";--c\r"
                             "  attribute TAP_SCAN_CLOCK of TCK : signal is (2.5E+7, BOTH);\r"
                             "  attribute INSTRUCTION_LENGTH of \\odd name\\ : entity is 1_0;\r"
                             "  attribute INSTRUCTION_OPCODE of \\odd name\\ : entity is \"\tBYPASS\t(11111\" &--x\r"
                             "     \"11111)\" ;\r"
                             "END ENTITY \\odd name\\;";
    ReaderPtr reader(BsdlReader::CreateBsdlReaderFromBuffer("lex.bsd", text.data(), text.size()));
    ASSERT_TRUE(reader);
    EXPECT_STREQ("\\odd name\\", reader->getCompName());
    EXPECT_EQ(10u, reader->getInstructionLength());
    EXPECT_STREQ("1111111111", reader->getInstructionOpcode("Bypass"));
    EXPECT_TRUE(recorder.messages.empty());

    // The same error is placed on the same line whatever the line ends.
    for (const char* eol : {"\n", "\r\n", "\r"}) {
        SCOPED_TRACE(testing::PrintToString(eol));
        const std::string bad = entity(kLength + "  attribute INSTRUCTION_OPCODE of DEV : entity is" + eol +
                                           "    \"BYPASS (11), \" &" + eol + "    \"SAMPLE 01\";" + eol,
                                       "", eol);
        EXPECT_NE(std::wstring::npos, errorOf(bad).find(L"line 9: INSTRUCTION_OPCODE: '(' expected after instruction "
                                                        L"SAMPLE"))
            << narrow(errorOf(bad));
    }
}

TEST(BsdlReaderText, WarningsAreCappedPerFile)
{
    std::string body = kLength + kOpcode;
    for (int i = 0; i < 50; ++i) body += "  ;\n";
    const std::string text = entity(body);
    MessageRecorder recorder;
    ReaderPtr reader(BsdlReader::CreateBsdlReaderFromBuffer("many.bsd", text.data(), text.size()));
    ASSERT_TRUE(reader);
    EXPECT_EQ(jexbsdl::BsdlDiagnostics::kMaxWarnings + 1, recorder.messages.size());
    EXPECT_TRUE(recorder.has(Port_MsgMan::MSG_WARNING, L"more warnings were suppressed"));
}

TEST(BsdlReaderHostile, RefusedWithoutCrashOrExhaustion)
{
    MessageRecorder recorder;
    // Deep nesting in a port clause and in an attribute value.
    for (const std::string& prefix : {std::string("entity DEV is port "), std::string("entity DEV is attribute A of "
                                                                                      "DEV : entity is ")}) {
        const std::string text = prefix + std::string(200000, '(');
        EXPECT_NE(std::wstring::npos, errorOf(text).find(L"parentheses nested deeper than 256 levels"));
    }
    // A very long string expression for a stored attribute.
    std::string longValue = entity(kLength + "  attribute INSTRUCTION_OPCODE of DEV : entity is \"BYPASS (11)\"");
    longValue.resize(longValue.find("end DEV"));
    for (int i = 0; i < 20000; ++i) longValue += " & \"" + std::string(60, ' ') + "\"";
    EXPECT_NE(std::wstring::npos, errorOf(longValue).find(L"INSTRUCTION_OPCODE is longer than"));
    // A text over the size limit is not looked at.
    const std::string huge(BsdlReader::kMaxFileSize + 1, ' ');
    EXPECT_NE(std::wstring::npos, errorOf(huge).find(L"larger than 64 MiB"));

    // Not BSDL at all: null, and the reason goes out as an error message.
    recorder.messages.clear();
    const std::string binary("\0\x01\xff\"entity\0is", 12);
    EXPECT_EQ(L"(no reader)", errorOf(binary));
    EXPECT_EQ(L"(no reader)", errorOf(""));
    EXPECT_TRUE(recorder.has(Port_MsgMan::MSG_ERROR, L"no entity declaration found"));
    EXPECT_EQ(nullptr, BsdlReader::CreateBsdlReaderFromBuffer(nullptr, nullptr, 5));

    // Files that cannot be read.
    recorder.messages.clear();
    EXPECT_EQ(nullptr, BsdlReader::CreateBsdlReader(nullptr));
    EXPECT_EQ(nullptr, BsdlReader::CreateBsdlReader((kData + "/no-such-file.bsd").c_str()));
    EXPECT_TRUE(recorder.has(Port_MsgMan::MSG_ERROR, wide("BSDL file '" + kData + "/no-such-file.bsd': cannot be opened")));
    EXPECT_EQ(nullptr, BsdlReader::CreateBsdlReader(kData.c_str()));
    EXPECT_TRUE(recorder.has(Port_MsgMan::MSG_ERROR, L"cannot be read"));
}
