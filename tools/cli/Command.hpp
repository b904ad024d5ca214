#pragma once
// The subcommands of jexjtag and their names.

#include <optional>
#include <string>

namespace jexjtag::cli {

enum class Command { None, Help, Targets, Scan, Lookup, Bsdl, Shift, Info, Serve };

// The command named by text ("scan"), or none.
std::optional<Command> commandFromName(const std::string& text);
// "scan" and so on; "" for Command::None.
const char* commandName(Command command);

} // namespace jexjtag::cli
