#include "App.hpp"

#include <cstdlib>
#include <string>
#include <vector>

#include "ArgParser.hpp"
#include "BsdlCommand.hpp"
#include "CliError.hpp"
#include "HelpText.hpp"
#include "InfoCommand.hpp"
#include "LookupCommand.hpp"
#include "MessageSink.hpp"
#include "ScanCommand.hpp"
#include "ServeCommand.hpp"
#include "ShiftCommand.hpp"
#include "TargetsCommand.hpp"
#include "UsageError.hpp"
#include "jexjtag/jexjtag.h"

#ifndef JEXJTAG_CLI_VERSION
#define JEXJTAG_CLI_VERSION "unknown"
#endif

namespace jexjtag::cli {

namespace {

constexpr int kExitSuccess = 0;
constexpr int kExitFailed = 1;
constexpr int kExitUsage = 2;

// The command named on a command line that did not parse, for the hint.
Command guessCommand(const std::vector<std::string>& args)
{
    for (const std::string& arg : args)
        if (const auto command = commandFromName(arg)) return *command;
    return Command::None;
}

// The library reads its log settings when logging starts, on the first call.
void applyLogSettings(const Options& options)
{
    if (options.logLevel) setenv("JEXJTAG_LOG_LEVEL", std::to_string(*options.logLevel).c_str(), 1);
    if (!options.logFile.empty()) setenv("JEXJTAG_LOG_FILE", options.logFile.c_str(), 1);
}

void printVersion(std::ostream& out)
{
    unsigned version = 0;
    char text[128] = {};
    JexJtag_session_getAPIVersion(&version, text, sizeof text);
    text[sizeof text - 1] = '\0';
    out << "jexjtag " << JEXJTAG_CLI_VERSION << "\nlibJexJtag API version 0x" << std::hex << std::uppercase
        << version << std::dec << std::nouppercase << " (" << text << ")\n";
}

void runCommand(const Options& options, MessageSink& sink, std::ostream& out)
{
    switch (options.command) {
    case Command::Targets: runTargets(options, sink, out); break;
    case Command::Scan: runScan(options, sink, out); break;
    case Command::Lookup: runLookup(options, sink, out); break;
    case Command::Bsdl: runBsdl(options, sink, out); break;
    case Command::Shift: runShift(options, sink, out); break;
    case Command::Info: runInfo(options, sink, out); break;
    case Command::Serve: runServe(options, sink, out); break;
    case Command::None:
    case Command::Help: break;
    }
}

} // namespace

int App::run(int argc, char** argv, std::ostream& out, std::ostream& err)
{
    const std::vector<std::string> args(argv + (argc > 0 ? 1 : 0), argv + (argc > 0 ? argc : 0));
    Options options;
    try {
        options = ArgParser::parse(args);
    } catch (const UsageError& e) {
        err << "jexjtag: " << e.what() << '\n' << usageHint(guessCommand(args)) << '\n';
        return kExitUsage;
    }

    if (options.help || options.command == Command::Help) {
        Command topic = options.command;
        if (options.command == Command::Help && !options.operands.empty())
            topic = commandFromName(options.operands[0]).value_or(Command::None);
        out << helpText(topic);
        return kExitSuccess;
    }

    applyLogSettings(options);
    if (options.version) {
        printVersion(out);
        return kExitSuccess;
    }

    MessageSink sink(err, options.verbose);
    try {
        runCommand(options, sink, out);
        out.flush();
        if (!out.good()) {
            err << "jexjtag: cannot write the output\n";
            return kExitFailed;
        }
        return kExitSuccess;
    } catch (const UsageError& e) {
        err << "jexjtag: " << e.what() << '\n' << usageHint(options.command) << '\n';
        return kExitUsage;
    } catch (const CliError& e) {
        err << "jexjtag: " << e.what() << '\n';
        return kExitFailed;
    } catch (const std::exception& e) {
        err << "jexjtag: unexpected failure: " << e.what() << '\n';
        return kExitFailed;
    }
}

} // namespace jexjtag::cli
