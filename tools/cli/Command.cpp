#include "Command.hpp"

namespace jexjtag::cli {

namespace {

struct Entry {
    Command command;
    const char* name;
};
const Entry kCommands[] = {{Command::Help, "help"},     {Command::Targets, "targets"}, {Command::Scan, "scan"},
                           {Command::Lookup, "lookup"}, {Command::Bsdl, "bsdl"},       {Command::Shift, "shift"},
                           {Command::Info, "info"}, {Command::Serve, "serve"}};

} // namespace

std::optional<Command> commandFromName(const std::string& text)
{
    for (const Entry& entry : kCommands)
        if (text == entry.name) return entry.command;
    return std::nullopt;
}

const char* commandName(Command command)
{
    for (const Entry& entry : kCommands)
        if (entry.command == command) return entry.name;
    return "";
}

} // namespace jexjtag::cli
