#include "InfoCommand.hpp"

#include <memory>

#include "CliError.hpp"
#include "InfoOutput.hpp"
#include "LibrarySession.hpp"
#include "TargetConnection.hpp"
#include "jexjtag/jexjtag.h"

namespace jexjtag::cli {

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

} // namespace jexjtag::cli
