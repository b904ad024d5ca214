// SPDX-License-Identifier: MIT
#include "Command.hpp"

namespace jexjtag::cli {

const CommandOption* Command::findOption(const std::string& longName) const
{
    for (const CommandOption& option : options)
        if (longName == option.longName) return &option;
    return nullptr;
}

const CommandOption* Command::findShortOption(char shortName) const
{
    for (const CommandOption& option : options)
        if (option.shortName != 0 && option.shortName == shortName) return &option;
    return nullptr;
}

const Command* findCommand(const std::vector<const Command*>& commands, const std::string& name)
{
    for (const Command* command : commands)
        if (name == command->name) return command;
    return nullptr;
}

} // namespace jexjtag::cli
