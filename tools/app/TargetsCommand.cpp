#include "TargetsCommand.hpp"

#include "LibrarySession.hpp"
#include "TargetsOutput.hpp"

namespace jexjtag::cli {

void runTargets(const Options& options, MessageSink& sink, std::ostream& out)
{
    TargetsResult result;
    result.withXml = options.xml;
    {
        LibrarySession session(options, sink);
        result.targets = session.targets(options.xml);
    }
    if (options.json) writeTargetsJson(out, result);
    else writeTargetsText(out, result);
}

} // namespace jexjtag::cli
