// SPDX-License-Identifier: MIT
#include "App.hpp"

#include <cstdlib>
#include <string>
#include <vector>

#include "ArgParser.hpp"
#include "CliError.hpp"
#include "CommandTable.hpp"
#include "HelpText.hpp"
#include "MessageSink.hpp"
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
const Command* guessCommand(const std::vector<std::string>& args)
{
    for (const std::string& arg : args)
        if (const Command* command = findCommand(commandTable(), arg)) return command;
    return nullptr;
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

} // namespace

int App::run(int argc, char** argv, std::ostream& out, std::ostream& err)
{
    const std::vector<std::string> args(argv + (argc > 0 ? 1 : 0), argv + (argc > 0 ? argc : 0));
    Options options;
    try {
        options = ArgParser::parse(args, commandTable());
    } catch (const UsageError& e) {
        err << "jexjtag: " << e.what() << '\n' << usageHint(guessCommand(args)) << '\n';
        return kExitUsage;
    }

    if (options.help) {
        out << (options.command ? options.command->page() : overviewText(commandTable()));
        return kExitSuccess;
    }

    applyLogSettings(options);
    if (options.version) {
        printVersion(out);
        return kExitSuccess;
    }

    MessageSink sink(err, options.verbose);
    try {
        options.command->run(options, sink, out);
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
