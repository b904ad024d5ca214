// SPDX-License-Identifier: MIT
// The "serve" command: the opened, locked target as a remote_bitbang server.

#include <optional>
#include <stdexcept>
#include <string>
#include <vector>

#include "CliError.hpp"
#include "Command.hpp"
#include "LibrarySession.hpp"
#include "MessageSink.hpp"
#include "Options.hpp"
#include "ServeEngine.hpp"
#include "ServeListener.hpp"
#include "StopSignal.hpp"
#include "TargetConnection.hpp"
#include "UsageError.hpp"
#include "jexjtag/jexjtag.h"

namespace jexjtag::cli {

namespace {

const char* const kPage = R"HELP(Usage: jexjtag serve [--listen HOST:PORT | --socket PATH] [OPTIONS]

Opens the target, takes the cable lock and serves the chain as a
remote_bitbang server (OpenOCD's "remote_bitbang" adapter protocol), so
that OpenOCD and other remote_bitbang clients can use any cable of the
library.  When ready it prints one line, "listening on HOST:PORT" (or
"listening on PATH"), on stdout.  One client at a time; the next one waits
until it leaves.  Ctrl-C or SIGTERM ends it and releases the cable.

The client's TCK/TMS/TDI levels are followed on a TAP state machine and
handed to the cable as TAP moves and register shifts in batches.  TRST
requests reset the TAPs with TMS; SRST requests are ignored.

Options:
      --listen HOST:PORT  TCP address to listen on (default 127.0.0.1:0;
                          port 0 takes any free port).  Other addresses than
                          loopback only when named here
      --socket PATH       listen on a Unix-domain socket instead
  -t, --target TYPE, -a, --arg KEY=VALUE, --chain CHAIN, --lock-wait MS,
      --no-lock, --datadir DIR, --log-level N, -v: see jexjtag --help
                          (-v also shows clients coming and going)

Examples:
  jexjtag serve --listen 127.0.0.1:3335
  openocd -c "adapter driver remote_bitbang" -c "remote_bitbang host 127.0.0.1" \
          -c "remote_bitbang port 3335" -c "transport select jtag" -c init -c scan_chain
)HELP";

constexpr const char* kDefaultListen = "127.0.0.1:0";
constexpr std::size_t kReceiveSize = 1 << 16;

using serve::ServeEngine;
using serve::ServeListener;

void say(MessageSink& sink, unsigned type, const std::string& text)
{
    sink.deliver(type, ("serve: " + text).c_str());
}

// Serves one connected client until it leaves, quits or a stop comes.
void serveClient(ServeListener& listener, ServeEngine& engine, MessageSink& sink, const serve::StopSignal& stop)
{
    std::vector<char> buffer(kReceiveSize);
    std::string why;
    try {
        for (;;) {
            const std::size_t n = listener.receive(buffer.data(), buffer.size(), &why);
            if (n == 0) break;
            const bool more = engine.feed(buffer.data(), n);
            if (!more) why = "the client quit";
            if (!more || !listener.hasInput() || engine.wantsSettle()) {
                engine.settle();
                if (!engine.replies().empty() && !listener.send(engine.replies())) {
                    why = stop.requested() ? "the server is stopping" : "the client has gone";
                    break;
                }
                engine.replies().clear();
            }
            if (!more) break;
        }
    } catch (const std::exception& e) {
        say(sink, JEX_MSG_ERROR, std::string(e.what()) + "; closing the connection to " + listener.peer());
        why.clear();
    }
    if (!engine.endClient()) {
        say(sink, JEX_MSG_ERROR, "the target failed while finishing the client's last clocks");
        try {
            engine.resetTap();
        } catch (const std::exception&) {
        }
    }
    if (!why.empty()) say(sink, JEX_MSG_NOISE, listener.peer() + ": " + why);
}

void checkServe(const Options& options)
{
    if (options.value("listen") && options.value("socket"))
        throw UsageError("'serve' takes --listen or --socket, not both");
}

void runServe(const Options& options, MessageSink& sink, std::ostream& out)
{
    LibrarySession session(options, sink);
    TargetConnection target(session, options);
    if (!options.noLock) target.lock(options.lockWaitMs);

    serve::StopSignal stop;
    std::optional<ServeListener> listener;
    try {
        const std::optional<std::string> path = options.value("socket");
        listener.emplace(path ? ServeListener::unixSocket(*path, stop.fd())
                              : ServeListener::tcp(options.value("listen").value_or(kDefaultListen), stop.fd()));
    } catch (const std::runtime_error& e) {
        throw CliError(e.what());
    }

    ServeEngine engine(target.handle(), [&sink](const std::string& text) { say(sink, JEX_MSG_WARNING, text); });
    try {
        engine.resetTap();
    } catch (const std::runtime_error& e) {
        throw CliError(std::string("serve: ") + e.what());
    }
    out << "listening on " << listener->address() << '\n';
    out.flush();

    while (listener->accept()) {
        say(sink, JEX_MSG_NOISE, "client " + listener->peer() + " connected");
        serveClient(*listener, engine, sink, stop);
        listener->dropClient();
    }
}

} // namespace

extern const Command serveCommand = {
    "serve", "serve", "serve the target to remote_bitbang clients (OpenOCD)",
    {{"listen", 0, true, checkNonEmptyValue}, {"socket", 0, true, checkNonEmptyValue}},
    0, 0, nullptr,
    checkServe,
    [] { return std::string(kPage); },
    runServe,
};

} // namespace jexjtag::cli
