// SPDX-License-Identifier: MIT
#pragma once
// The "serve" command: the opened, locked target as a remote_bitbang server.

#include <ostream>

#include "MessageSink.hpp"
#include "Options.hpp"

namespace jexjtag::cli {

// Prints "listening on HOST:PORT" (or "listening on PATH") to out, flushed,
// then serves one client at a time until SIGINT or SIGTERM; throws CliError
// when the target or the socket cannot be had.
void runServe(const Options& options, MessageSink& sink, std::ostream& out);

} // namespace jexjtag::cli
