// SPDX-License-Identifier: MIT
// The "help" command: the overview, or the page of one command.

#include "CommandTable.hpp"
#include "HelpText.hpp"
#include "MessageSink.hpp"
#include "Options.hpp"
#include "UsageError.hpp"

namespace jexjtag::cli {

namespace {

void checkTopic(const Options& options)
{
    if (!options.operands.empty() && !findCommand(commandTable(), options.operands[0]))
        throw UsageError("unknown command '" + options.operands[0] + "'");
}

void runHelp(const Options& options, MessageSink&, std::ostream& out)
{
    if (options.operands.empty()) out << overviewText(commandTable());
    else out << findCommand(commandTable(), options.operands[0])->page();
}

} // namespace

extern const Command helpCommand = {
    "help", "help [COMMAND]", "print this text, or the page of one command",
    {},
    0, 1, "takes at most one command name",
    checkTopic,
    [] { return overviewText(commandTable()); },
    runHelp,
};

} // namespace jexjtag::cli
