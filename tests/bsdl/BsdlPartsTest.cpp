// SPDX-License-Identifier: MIT
// BSDL parts read in full through the C API (bsdl.h): every vendor file's
// boundary register, opcodes and pins, the BSDL library by IDCODE, and
// boundary registers the reader must refuse.

#include <gtest/gtest.h>

#include <cstring>
#include <regex>
#include <sstream>
#include <string>
#include <vector>

#include "BsdlTestData.hpp"
#include "jexjtag/jexjtag.h"
#include "support/TestSupport.hpp"

namespace {

std::vector<std::string> g_errors;
void record(unsigned, unsigned type, const char* text)
{
    if (type == JEX_MSG_ERROR) g_errors.push_back(text);
}

class BsdlParts : public ::testing::Test {
protected:
    void SetUp() override
    {
        g_errors.clear();
        ASSERT_EQ(JEX_SUCCESS, JexJtag_session_create(record, 0, nullptr, &handle));
    }
    void TearDown() override { JexJtag_session_destroy(handle); }

    std::string instruction(unsigned part, unsigned index, std::string* opcodes = nullptr)
    {
        char name[64], codes[4096];
        EXPECT_EQ(JEX_SUCCESS, JexJtag_bsdl_getInstruction(handle, part, index, name, sizeof name, codes, sizeof codes));
        if (opcodes) *opcodes = codes;
        return name;
    }
    JexBsdlPin pin(unsigned part, const std::string& port)
    {
        JexBsdlSummary s;
        JexJtag_bsdl_getSummary(handle, part, &s);
        JexBsdlPin p {};
        for (unsigned i = 0; i < s.pinCount; ++i)
            if (JexJtag_bsdl_getPin(handle, part, i, &p) == JEX_SUCCESS && port == p.port) return p;
        ADD_FAILURE() << "no pin " << port;
        return p;
    }

    testsupport::IsolatedEnvironment env;
    unsigned handle = 0;
};

} // namespace

TEST_F(BsdlParts, EveryVendorFileHasItsBoundaryLengthInCellsAndItsOpcodes)
{
    const std::regex lengthRe("BOUNDARY_LENGTH\\s+of\\s+\\w+\\s*:\\s*entity\\s+is\\s+(\\d+)", std::regex::icase);
    for (const ManifestRow& row : readManifest()) {
        SCOPED_TRACE(row.file);
        const std::string path = kData + "/" + row.file;
        std::smatch m;
        const std::string text = testsupport::readFile(path);
        ASSERT_TRUE(std::regex_search(text, m, lengthRe));
        unsigned part = 0;
        ASSERT_EQ(JEX_SUCCESS, JexJtag_bsdl_open(handle, path.c_str(), &part));
        JexBsdlSummary s;
        ASSERT_EQ(JEX_SUCCESS, JexJtag_bsdl_getSummary(handle, part, &s));
        EXPECT_EQ(row.entity, s.entity);
        EXPECT_EQ(std::stoul(m[1]), s.boundaryLength);
        for (unsigned n = 0; n < s.boundaryLength; ++n) {
            JexBsdlCell cell;
            ASSERT_EQ(JEX_SUCCESS, JexJtag_bsdl_getCell(handle, part, n, &cell));
            ASSERT_EQ(n, cell.number);
            if (cell.controlCell >= 0) {
                ASSERT_LT(static_cast<unsigned>(cell.controlCell), s.boundaryLength);
            }
        }
        JexBsdlCell beyond;
        EXPECT_EQ(JEX_FAILURE, JexJtag_bsdl_getCell(handle, part, s.boundaryLength, &beyond));
        // Every opcode has INSTRUCTION_LENGTH bits; BYPASS has all of its codes.
        bool sawBypass = false;
        for (unsigned i = 0; i < s.instructionCount; ++i) {
            std::string codes;
            const std::string name = instruction(part, i, &codes);
            std::stringstream list(codes);
            for (std::string code; std::getline(list, code, ',');) EXPECT_EQ(s.irLength, code.size()) << name;
            if (name == "BYPASS" || name == "bypass") {
                EXPECT_EQ(row.allBypass, codes);
                sawBypass = true;
            }
        }
        EXPECT_TRUE(sawBypass);
        EXPECT_EQ(JEX_SUCCESS, JexJtag_bsdl_close(handle, part));
    }
    EXPECT_TRUE(g_errors.empty()) << g_errors.front();
}

TEST_F(BsdlParts, PinMapsCellsAndRegisterAccessAsTheFilesSayThem)
{
    unsigned dios = 0, ti = 0;
    ASSERT_EQ(JEX_SUCCESS, JexJtag_bsdl_open(handle, (kData + "/jtagtech_MPV_DIOS.bsd").c_str(), &dios));
    ASSERT_EQ(JEX_SUCCESS, JexJtag_bsdl_open(handle, (kData + "/ti_SN74BCT8244A_crlf.bsd").c_str(), &ti));
    // bit_vector(1 to 16) mapped to (1, ..., 16); a scalar port.
    EXPECT_STREQ("1", pin(dios, "CH(1)").pin);
    EXPECT_STREQ("16", pin(dios, "CH(16)").pin);
    EXPECT_STREQ("126", pin(dios, "S1").pin);
    char capture[16];
    ASSERT_EQ(JEX_SUCCESS, JexJtag_bsdl_getInstructionCapture(handle, dios, capture, sizeof capture));
    EXPECT_STREQ("00000001", capture);
    char reg[32], instructions[64];
    unsigned length = 0;
    ASSERT_EQ(JEX_SUCCESS, JexJtag_bsdl_getRegisterAccess(handle, dios, 1, reg, sizeof reg, &length, instructions,
                                                          sizeof instructions));
    EXPECT_STREQ("ECID", reg);
    EXPECT_EQ(67u, length);
    EXPECT_STREQ("ECIDCODE", instructions);

    // The SN74BCT8244A: outputs enabled by control cell 17 (disable value 1),
    // which also captures OE_NEG1 (a merged cell); A1:(23,22,21,20).
    const JexBsdlPin y = pin(ti, "Y1(4)");
    EXPECT_EQ(JEXJTAG_BSDL_OUTPUT3, y.function);
    EXPECT_EQ(4, y.outputCell);
    EXPECT_EQ(17, y.controlCell);
    EXPECT_EQ(-1, y.inputCell);
    JexBsdlCell c17;
    ASSERT_EQ(JEX_SUCCESS, JexJtag_bsdl_getCell(handle, ti, 17, &c17));
    EXPECT_EQ(JEXJTAG_BSDL_CONTROL, c17.function);
    EXPECT_STREQ("OE_NEG1", c17.mergedInput);
    EXPECT_EQ('1', c17.safe);
    JexBsdlCell c4;
    ASSERT_EQ(JEX_SUCCESS, JexJtag_bsdl_getCell(handle, ti, 4, &c4));
    EXPECT_EQ('1', c4.disableValue);
    EXPECT_STREQ("Z", c4.disableResult);
    EXPECT_STREQ("BC_1", c4.cellType);
    EXPECT_STREQ("23", pin(ti, "A1(1)").pin);
    EXPECT_EQ(17, pin(ti, "OE_NEG1").inputCell);
    EXPECT_EQ(JEXJTAG_BSDL_INPUT, pin(ti, "OE_NEG1").function);
    EXPECT_STREQ("observe_only", JexJtag_bsdl_functionName(JEXJTAG_BSDL_OBSERVE_ONLY));
}

TEST_F(BsdlParts, BadBoundaryRegistersAreRefusedNamingFileAndLine)
{
    const auto part = [](const std::string& cells, unsigned length = 3) {
        return "entity BAD is\n"
               "  port (TDI : in bit; TDO : out bit; IO : inout bit_vector(0 to 1));\n"
               "  attribute INSTRUCTION_LENGTH of BAD : entity is 2;\n"
               "  attribute INSTRUCTION_OPCODE of BAD : entity is \"BYPASS (11), EXTEST (00), SAMPLE (01)\";\n"
               "  attribute BOUNDARY_LENGTH of BAD : entity is " + std::to_string(length) + ";\n"
               "  attribute BOUNDARY_REGISTER of BAD : entity is\n"
               "    \"0 (BC_1, *, control, 1),\" &\n" + cells + ";\n"
               "end BAD;\n";
    };
    const struct {
        std::string text;
        const char* message;
    } cases[] = {
        {part("    \"1 (BC_1, IO(0), output3, X, 0, 1, Z), 2 (BC_1, IO(1), input, X)\""), nullptr},
        {part("    \"1 (BC_1, IO(0), output3, X, 0, 1, Z),\" &\n    \"3 (BC_1, IO(1), input, X)\""),
         "line 9: BOUNDARY_REGISTER: cell 3 is outside the register of BOUNDARY_LENGTH 3"},
        {part("    \"1 (BC_1, IO(0), output3, X, 0, 1, Z),\" &\n    \"1 (BC_1, IO(1), output3, X, 0, 1, Z)\""),
         "line 9: BOUNDARY_REGISTER: cell 1 is described again (first on line 8)"},
        {part("    \"1 (BC_1, IO(0), output9, X), 2 (BC_1, IO(1), input, X)\""),
         "line 8: BOUNDARY_REGISTER: cell 1 has the unknown function 'output9'"},
        {part("    \"1 (BC_1, IO(0), output3, X, 2, 1, Z),\" &\n    \"2 (BC_1, IO(1), input, X)\""),
         "line 8: BOUNDARY_REGISTER: cell 1 names control cell 2, whose function is input, not control"},
        {part("    \"1 (BC_1, IO(0), output3, X, 0, 1, Z)\""), "cell 2 of BOUNDARY_LENGTH 3 is not described"},
        {part("    \"1 (BC_1, IO(0), output3, X, 0, 1, Q)\""), "the disable result of cell 1 must be Z"},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.text);
        g_errors.clear();
        unsigned id = 99;
        const uint32_t status =
            JexJtag_bsdl_openBuffer(handle, "bad.bsd", c.text.data(), static_cast<unsigned>(c.text.size()), &id);
        if (!c.message) {
            EXPECT_EQ(JEX_SUCCESS, status);
            continue;
        }
        EXPECT_EQ(JEX_FAILURE, status);
        EXPECT_EQ(0u, id);
        ASSERT_EQ(1u, g_errors.size());
        EXPECT_EQ(0u, g_errors[0].find("BSDL file 'bad.bsd', ")) << g_errors[0];
        EXPECT_NE(std::string::npos, g_errors[0].find(c.message)) << g_errors[0];
    }
}

TEST_F(BsdlParts, TheLibraryFindsFilesByIdcodeWithDontCareBits)
{
    unsigned added = 0;
    ASSERT_EQ(JEX_SUCCESS, JexJtag_bsdl_addDirectory(handle, kData.c_str(), &added));
    EXPECT_EQ(32u, added); // every vendor file but the one without IDCODE_REGISTER
    char entity[128], path[1024];
    unsigned ir = 0;
    // STM32F405: XXXX0110010000010011000001000001 - any version matches.
    ASSERT_EQ(JEX_SUCCESS, JexJtag_bsdl_findByIdcode(handle, "10100110010000010011000001000001", entity, sizeof entity,
                                                     &ir, path, sizeof path));
    EXPECT_STREQ("STM32F405_415_407_417_LQFP100", entity);
    EXPECT_EQ(5u, ir);
    EXPECT_NE(std::string::npos, std::string(path).find("st_STM32F405_415_407_417_LQFP100.bsd"));
    ASSERT_EQ(JEX_SUCCESS, JexJtag_bsdl_findByIdcode(handle, "10", entity, sizeof entity, &ir, path, sizeof path));
    EXPECT_STREQ("", entity);
    EXPECT_EQ(0u, ir);
    EXPECT_EQ(JEX_FAILURE, JexJtag_bsdl_addDirectory(handle, (kData + "/no-such-dir").c_str(), &added));
}
