// SPDX-License-Identifier: MIT
// The program's command line, parsed with its command table: the usage errors.

#include <gtest/gtest.h>

#include <string>
#include <utility>
#include <vector>

#include "ArgParser.hpp"
#include "CommandTable.hpp"
#include "UsageError.hpp"

using jexjtag::cli::ArgParser;
using jexjtag::cli::commandTable;
using jexjtag::cli::UsageError;

namespace {

// The message of the usage error that parsing args raises ("" when none).
std::string usageErrorOf(std::vector<std::string> args)
{
    try {
        ArgParser::parse(args, commandTable());
    } catch (const UsageError& e) {
        return e.what();
    }
    return "";
}

} // namespace

TEST(ArgParserTest, HelpAndVersionSkipTheOperandChecks)
{
    // 'shift --help' without operands and --version run in CliProgramTest;
    // unknown options or commands are refused also with --help.
    EXPECT_TRUE(ArgParser::parse({"-h"}, commandTable()).help);
    EXPECT_EQ("unknown option '--frobnicate'", usageErrorOf({"--help", "--frobnicate"}));
    EXPECT_EQ("unknown command 'frobnicate'", usageErrorOf({"frobnicate", "--help"}));
    EXPECT_EQ("unknown command 'nosuch'", usageErrorOf({"help", "nosuch"}));
}

TEST(ArgParserTest, MisuseIsAUsageErrorThatSaysWhat)
{
    const std::pair<std::vector<std::string>, const char*> cases[] = {
        {{}, "no command given"},
        {{"scna"}, "unknown command 'scna'"},
        {{"scan", "--frobnicate"}, "unknown option '--frobnicate'"},
        {{"scan", "-x"}, "unknown option '-x'"},
        {{"lookup", "-5"}, "unknown option '-5'"},
        {{"scan", "--target"}, "--target needs a value"},
        {{"scan", "--target="}, "--target needs a target type name"},
        {{"scan", "--json=yes"}, "--json takes no value"},
        {{"scan", "--device", "1"}, "option --device does not apply to 'scan'"},
        {{"scan", "--ir", "0x1"}, "option --ir does not apply to 'scan'"},
        {{"--xml", "shift", "dr", "0x1"}, "option --xml does not apply to 'shift'"},
        {{"scan", "--arg", "port"}, "--arg needs KEY=VALUE, not 'port'"},
        {{"scan", "--arg", "=x"}, "--arg needs KEY=VALUE, not '=x'"},
        {{"scan", "--log-level", "6"}, "--log-level needs a number from 0 to 5, not '6'"},
        {{"scan", "--lock-wait=-1"}, "--lock-wait needs a number, not '-1'"},
        {{"scan", "--lock-wait", "99999999999"}, "--lock-wait needs a number, not '99999999999'"},
        {{"shift", "dr", "-d", "1x", "0x1"}, "--device needs a number, not '1x'"},
        // Operand counts and the rules of shift.
        {{"scan", "extra"}, "'scan' takes no operands (1 given)"},
        {{"lookup"}, "'lookup' needs one IDCODE (0 given)"},
        {{"lookup", "0x1", "0x2"}, "'lookup' needs one IDCODE (2 given)"},
        {{"bsdl"}, "'bsdl' needs one BSDL file (0 given)"},
        {{"shift", "xr", "0x1"}, "'shift' needs ir or dr first, not 'xr'"},
        {{"shift", "dr"}, "'shift' needs data to shift, or --bits N to read only"},
        {{"shift", "dr", "0x1", "0x2"}, "'shift' needs ir or dr and the data to shift (3 given)"},
        {{"shift", "dr", "--bits", "0"}, "--bits needs a length from 1 to 1048576"},
        {{"shift", "ir", "--ir", "0x1", "0x2"}, "--ir goes with 'shift dr' only"},
    };
    for (const auto& [args, message] : cases) EXPECT_EQ(message, usageErrorOf(args));
}
