// SPDX-License-Identifier: MIT
#include "CommandTable.hpp"

namespace jexjtag::cli {

// One line per command, in the order of the overview: X(name) stands for
// the entry `nameCommand` that app/<Name>Command.cpp defines.
#define JEXJTAG_COMMANDS(X) \
    X(targets)              \
    X(cables)               \
    X(scan)                 \
    X(lookup)               \
    X(bsdl)                 \
    X(shift)                \
    X(info)                 \
    X(svf)                  \
    X(serve)                \
    X(help)

#define JEXJTAG_DECLARE_COMMAND(name) extern const Command name##Command;
JEXJTAG_COMMANDS(JEXJTAG_DECLARE_COMMAND)
#undef JEXJTAG_DECLARE_COMMAND

const std::vector<const Command*>& commandTable()
{
#define JEXJTAG_COMMAND_ENTRY(name) &name##Command,
    static const std::vector<const Command*> table = {JEXJTAG_COMMANDS(JEXJTAG_COMMAND_ENTRY)};
#undef JEXJTAG_COMMAND_ENTRY
    return table;
}

} // namespace jexjtag::cli
