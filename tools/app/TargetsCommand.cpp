// SPDX-License-Identifier: MIT
// The "targets" command.

#include "LibrarySession.hpp"
#include "MessageSink.hpp"
#include "Options.hpp"
#include "TargetsOutput.hpp"

namespace jexjtag::cli {

namespace {

const char* const kPage = R"HELP(Usage: jexjtag targets [--xml] [OPTIONS]

Lists the target types that the installed plug-ins offer, in discovery
order, each with the name of the plug-in that serves it.

Options:
      --xml       also print each plug-in's descriptor text
      --json      {"count": N, "targets": [{"index", "name", "plugin"[, "xml"]}]}
      --datadir DIR, --log-level N, --log-file FILE, --verbose: see jexjtag --help

Examples:
  jexjtag targets
  jexjtag targets --xml
)HELP";

void runTargets(const Options& options, MessageSink& sink, std::ostream& out)
{
    TargetsResult result;
    result.withXml = options.flag("xml");
    {
        LibrarySession session(options, sink);
        result.targets = session.targets(options.flag("xml"));
    }
    if (options.json) writeTargetsJson(out, result);
    else writeTargetsText(out, result);
}

} // namespace

extern const Command targetsCommand = {
    "targets", "targets", "list the target types the installed plug-ins offer",
    {{"xml", 0, false}},
    0, 0, nullptr,
    nullptr,
    [] { return std::string(kPage); },
    runTargets,
};

} // namespace jexjtag::cli
