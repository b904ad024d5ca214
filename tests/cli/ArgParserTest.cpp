// The command line: options, operands, values and the usage errors.

#include <gtest/gtest.h>

#include <string>
#include <utility>
#include <vector>

#include "ArgParser.hpp"
#include "UsageError.hpp"

using jexjtag::cli::ArgParser;
using jexjtag::cli::Command;
using jexjtag::cli::Options;
using jexjtag::cli::UsageError;

namespace {

Options parse(std::vector<std::string> args) { return ArgParser::parse(args); }

// The message of the usage error that parsing args raises ("" when none).
std::string usageErrorOf(std::vector<std::string> args)
{
    try {
        ArgParser::parse(args);
    } catch (const UsageError& e) {
        return e.what();
    }
    return "";
}

} // namespace

TEST(ArgParserTest, DefaultsAreTheSimulatedCableWithALockWait)
{
    // The other defaults (text output, no log level, no data dir) show in CliProgramTest's runs.
    const Options o = parse({"scan"});
    EXPECT_EQ(Command::Scan, o.command);
    EXPECT_EQ("jtag_sim", o.targetType);
    EXPECT_EQ(5000u, o.lockWaitMs);
    EXPECT_FALSE(o.noLock);
    EXPECT_EQ(1u, o.exitState); // RUN_TEST_IDLE
}

TEST(ArgParserTest, OptionsStandBeforeOrAfterTheCommandInBothForms)
{
    const Options o = parse({"--json", "-t", "my_cable", "scan", "--arg", "port=sim0", "--chain=0x4BA00477:4",
                             "-a", "vcd=/tmp/x.vcd", "--lock-wait=250", "--log-level", "3", "--datadir", "/d",
                             "--log-file=/tmp/log", "-v", "--no-lock", "--no-autodetect"});
    EXPECT_EQ(Command::Scan, o.command);
    EXPECT_TRUE(o.json);
    EXPECT_TRUE(o.verbose);
    EXPECT_TRUE(o.noLock);
    EXPECT_TRUE(o.noAutodetect);
    EXPECT_EQ("my_cable", o.targetType);
    // --arg and --chain keep their order; --chain is "chain=CHAIN".
    EXPECT_EQ((std::vector<std::string>{"port=sim0", "chain=0x4BA00477:4", "vcd=/tmp/x.vcd"}), o.targetArgs);
    EXPECT_EQ(250u, o.lockWaitMs);
    EXPECT_EQ(3u, o.logLevel.value());
    EXPECT_EQ("/d", o.dataDir);
    EXPECT_EQ("/tmp/log", o.logFile);
}

TEST(ArgParserTest, ShiftTakesRegisterDataDeviceBitsAndExitState)
{
    Options o = parse({"shift", "IR", "--device", "1", "0x09", "--exit", "pause-ir"});
    EXPECT_EQ(Command::Shift, o.command);
    EXPECT_EQ((std::vector<std::string>{"ir", "0x09"}), o.operands); // register name lower-cased
    EXPECT_EQ(1u, o.device.value());
    EXPECT_EQ(13u, o.exitState); // PAUSE_IR
    EXPECT_FALSE(o.bits.has_value());

    o = parse({"shift", "dr", "-d", "0", "-n", "32"});
    EXPECT_EQ((std::vector<std::string>{"dr"}), o.operands); // read only
    EXPECT_EQ(0u, o.device.value());
    EXPECT_EQ(32u, o.bits.value());

    o = parse({"shift", "dr", "-d", "1", "--ir", "0x09", "0x0"});
    EXPECT_EQ("0x09", o.irData.value());

    o = parse({"shift", "dr", "--exit=JEXJTAG_TEST_LOGIC_RESET", "--", "0b1"});
    EXPECT_EQ(0u, o.exitState);
    EXPECT_EQ("0b1", o.operands[1]);
}

TEST(ArgParserTest, OtherCommandsTakeTheirOperands)
{
    EXPECT_EQ("0x0362D093", parse({"lookup", "0x0362D093"}).operands.at(0));
    EXPECT_EQ("a b.bsd", parse({"bsdl", "a b.bsd"}).operands.at(0));
    EXPECT_TRUE(parse({"targets", "--xml"}).xml);
    EXPECT_EQ(Command::Info, parse({"info"}).command);
}

TEST(ArgParserTest, HelpAndVersionSkipTheOperandChecks)
{
    // shift without its operands, and no command at all, are fine with --help.
    EXPECT_TRUE(parse({"shift", "--help"}).help);
    EXPECT_TRUE(parse({"-h"}).help);
    EXPECT_EQ(Command::None, parse({"--help"}).command);
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
