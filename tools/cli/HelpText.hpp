// SPDX-License-Identifier: MIT
#pragma once
// The program's overview (the page of --help without a command) and the
// hint after a usage error.  Each command's own page is in its entry.

#include <string>
#include <vector>

#include "Command.hpp"

namespace jexjtag::cli {

// The overview, listing commands in table order: each entry's synopsis and
// summary.
std::string overviewText(const std::vector<const Command*>& commands);

// The line printed after a usage error; command may be null.
std::string usageHint(const Command* command);

} // namespace jexjtag::cli
