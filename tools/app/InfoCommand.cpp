// SPDX-License-Identifier: MIT
// The "info" command.

#include <memory>

#include "CliError.hpp"
#include "InfoOutput.hpp"
#include "LibrarySession.hpp"
#include "MessageSink.hpp"
#include "Options.hpp"
#include "TargetConnection.hpp"
#include "jexjtag/jexjtag.h"

namespace jexjtag::cli {

namespace {

const char* const kPage = R"HELP(Usage: jexjtag info [OPTIONS]

Opens the target and prints its information record (names, versions,
vendor, frequency, port, flags) and the library's API version.

Options:
      --json      {"api_version", "api_version_text", "target": {...}}
  -t, --target TYPE, -a, --arg KEY=VALUE, --chain CHAIN: see jexjtag --help

Examples:
  jexjtag info
  jexjtag info --target jtag_sim --arg new_firmware=1 --json
)HELP";

void runInfo(const Options& options, MessageSink& sink, std::ostream& out)
{
    InfoResult result;
    result.targetType = options.targetType;
    {
        LibrarySession session(options, sink);
        char versionText[128] = {};
        if (JEX_FAILED(JexJtag_session_getAPIVersion(&result.apiVersion, versionText, sizeof versionText)))
            throw CliError("cannot read the API version");
        versionText[sizeof versionText - 1] = '\0';
        result.apiVersionText = versionText;

        TargetConnection target(session, options);
        auto info = std::make_unique<JexJtagTargetInfo>();
        if (JEX_FAILED(JexJtag_target_getInfo(target.handle(), info.get())))
            throw CliError("cannot read the information record of target '" + target.type() + "'");
        result.fields = infoFields(*info);
        result.targetFlags = info->target_flags;
    }
    if (options.json) writeInfoJson(out, result);
    else writeInfoText(out, result);
}

} // namespace

extern const Command infoCommand = {
    "info", "info", "print the target's information record and the API version",
    {},
    0, 0, nullptr,
    nullptr,
    [] { return std::string(kPage); },
    runInfo,
};

} // namespace jexjtag::cli
