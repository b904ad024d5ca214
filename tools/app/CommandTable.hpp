// SPDX-License-Identifier: MIT
#pragma once
// The program's commands, in the order `jexjtag help` lists them.

#include <vector>

#include "Command.hpp"

namespace jexjtag::cli {

const std::vector<const Command*>& commandTable();

} // namespace jexjtag::cli
