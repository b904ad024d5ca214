#pragma once
// The "info" command.

#include <ostream>

#include "MessageSink.hpp"
#include "Options.hpp"

namespace jexjtag::cli {

// Writes the result to out (text or JSON); throws CliError or UsageError.
void runInfo(const Options& options, MessageSink& sink, std::ostream& out);

} // namespace jexjtag::cli
