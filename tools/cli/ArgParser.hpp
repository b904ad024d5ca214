// SPDX-License-Identifier: MIT
#pragma once
// Turns the program's arguments into Options.
//
//   jexjtag [OPTIONS] COMMAND [OPTIONS] [OPERANDS]
//
// Options may stand before or after the command; "--name value" and
// "--name=value" are the same; "--" ends the options.  Options of one
// command given to another, unknown options, bad values and wrong operand
// counts are usage errors (UsageError).  With --help or --version the
// operands are not checked.  The options every command takes are the
// parser's own; each command brings its name, options and operand rules in
// its entry (Command).

#include <string>
#include <vector>

#include "Options.hpp"

namespace jexjtag::cli {

class ArgParser {
public:
    // args: the arguments after the program name; commands: the program's
    // command table.
    static Options parse(const std::vector<std::string>& args, const std::vector<const Command*>& commands);
};

} // namespace jexjtag::cli
