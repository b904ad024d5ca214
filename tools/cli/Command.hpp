// SPDX-License-Identifier: MIT
#pragma once
// One command of jexjtag: everything the program knows about it, in one
// entry.  The parser, the help texts and the dispatch all read these
// entries; the program's commands are listed in app/CommandTable.cpp and
// each is defined in app/<Name>Command.cpp.

#include <ostream>
#include <string>
#include <vector>

namespace jexjtag::cli {

struct Options;
class MessageSink;

// An option that belongs to one command (the options of every command are
// the parser's own).  The parser keeps what it was given in
// Options::commandValues; the command reads it with Options::flag, value,
// values and number.
struct CommandOption {
    const char* longName; // "device" for --device
    char shortName;       // 'd' for -d; 0 for none
    bool takesValue;      // --device N; false for a flag such as --xml
    // Checks each value as it is parsed (e.g. checkNumberValue); throws
    // UsageError.  May be null.
    void (*checkValue)(const std::string& longName, const std::string& value) = nullptr;
};

struct Command {
    const char* name;     // "lookup": the word on the command line
    const char* synopsis; // "lookup IDCODE": the left column of the overview
    const char* summary;  // its right column, one line
    std::vector<CommandOption> options;

    // Operand count: outside [minOperands, maxOperands] the usage error is
    // "'NAME' OPERANDRULE (N given)"; a null rule reads "takes no operands".
    unsigned minOperands;
    unsigned maxOperands;
    const char* operandRule;

    // Further usage rules, run after parsing (not with --help or --version);
    // throws UsageError.  May be null.
    void (*check)(const Options& options);

    // The --help page.
    std::string (*page)();

    // Carries the command out and writes its result to out (text or JSON);
    // library messages go to sink.  Throws CliError (exit 1) or UsageError
    // (exit 2).
    void (*run)(const Options& options, MessageSink& sink, std::ostream& out);

    // The option of this command called longName (without "--"), or null.
    const CommandOption* findOption(const std::string& longName) const;
    // The option of this command with the short name, or null.
    const CommandOption* findShortOption(char shortName) const;
};

// The command called name in commands, or null.
const Command* findCommand(const std::vector<const Command*>& commands, const std::string& name);

} // namespace jexjtag::cli
