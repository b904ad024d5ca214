// The command line, parsed with the program's command table: options,
// operands, values and the usage errors.

#include <gtest/gtest.h>

#include <string>
#include <utility>
#include <vector>

#include "ArgParser.hpp"
#include "CommandTable.hpp"
#include "UsageError.hpp"

using jexjtag::cli::ArgParser;
using jexjtag::cli::commandTable;
using jexjtag::cli::Options;
using jexjtag::cli::UsageError;

namespace {

Options parse(std::vector<std::string> args) { return ArgParser::parse(args, commandTable()); }

std::string commandOf(const Options& options) { return options.command ? options.command->name : ""; }

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

TEST(ArgParserTest, OptionsStandBeforeOrAfterTheCommandInBothForms)
{
    // The defaults (jtag_sim, a 5 s lock wait, text output) show in CliProgramTest's runs.
    const Options o = parse({"--json", "-t", "my_cable", "scan", "--arg", "port=sim0", "--chain=0x4BA00477:4",
                             "-a", "vcd=/tmp/x.vcd", "--lock-wait=250", "--log-level", "3", "--datadir", "/d",
                             "--log-file=/tmp/log", "-v", "--no-lock", "--no-autodetect"});
    EXPECT_EQ("scan", commandOf(o));
    EXPECT_TRUE(o.json);
    EXPECT_TRUE(o.verbose);
    EXPECT_TRUE(o.noLock);
    EXPECT_TRUE(o.flag("no-autodetect"));
    EXPECT_EQ("my_cable", o.targetType);
    // --arg and --chain keep their order; --chain is "chain=CHAIN".
    EXPECT_EQ((std::vector<std::string>{"port=sim0", "chain=0x4BA00477:4", "vcd=/tmp/x.vcd"}), o.targetArgs);
    EXPECT_EQ(250u, o.lockWaitMs);
    EXPECT_EQ(3u, o.logLevel.value());
    EXPECT_EQ("/d", o.dataDir);
    EXPECT_EQ("/tmp/log", o.logFile);
}

TEST(ArgParserTest, ACommandsOwnOptionsKeepEveryValueInOrder)
{
    // Short and long names, before and after the command, "--" before an operand.
    const Options o = parse({"-d", "1", "shift", "dr", "--device=2", "-n", "8", "--exit", "pause-dr", "--", "-0"});
    EXPECT_EQ((std::vector<std::string>{"dr", "-0"}), o.operands);
    EXPECT_EQ((std::vector<std::string>{"1", "2"}), o.values("device"));
    EXPECT_EQ(2u, o.number("device").value());
    EXPECT_EQ("pause-dr", o.value("exit").value());
    EXPECT_FALSE(o.value("ir").has_value());
    EXPECT_TRUE(parse({"targets", "--xml"}).flag("xml"));
}

TEST(ArgParserTest, HelpAndVersionSkipTheOperandChecks)
{
    // shift without its operands, and no command at all, are fine with --help.
    EXPECT_TRUE(parse({"shift", "--help"}).help);
    EXPECT_TRUE(parse({"-h"}).help);
    EXPECT_EQ(nullptr, parse({"--help"}).command);
    EXPECT_TRUE(parse({"--version"}).version);
    // ... but not unknown options or commands.
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
