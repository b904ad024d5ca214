#pragma once
// The texts of --help: the program's overview and one page per command.

#include <string>

#include "Command.hpp"

namespace jexjtag::cli {

// Command::None (and Command::Help) give the overview.
std::string helpText(Command command);

// The line printed after a usage error.
std::string usageHint(Command command);

} // namespace jexjtag::cli
