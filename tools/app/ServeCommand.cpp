// SPDX-License-Identifier: MIT
#include "ServeCommand.hpp"

#include <optional>
#include <stdexcept>
#include <string>
#include <vector>

#include "CliError.hpp"
#include "LibrarySession.hpp"
#include "ServeEngine.hpp"
#include "ServeListener.hpp"
#include "StopSignal.hpp"
#include "TargetConnection.hpp"
#include "jexjtag/jexjtag.h"

namespace jexjtag::cli {

namespace {

constexpr const char* kDefaultListen = "127.0.0.1:0";
constexpr std::size_t kReceiveSize = 1 << 16;

using serve::ServeEngine;
using serve::ServeListener;

void say(MessageSink& sink, unsigned type, const std::string& text)
{
    sink.deliver(type, ("serve: " + text).c_str());
}

// Serves one connected client until it leaves; false when a stop came.
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

} // namespace

void runServe(const Options& options, MessageSink& sink, std::ostream& out)
{
    LibrarySession session(options, sink);
    TargetConnection target(session, options);
    if (!options.noLock) target.lock(options.lockWaitMs);

    serve::StopSignal stop;
    std::optional<ServeListener> listener;
    try {
        listener.emplace(options.serveSocket.empty()
                             ? ServeListener::tcp(options.serveListen.empty() ? kDefaultListen : options.serveListen,
                                                  stop.fd())
                             : ServeListener::unixSocket(options.serveSocket, stop.fd()));
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

} // namespace jexjtag::cli
