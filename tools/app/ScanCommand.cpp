#include "ScanCommand.hpp"

#include "ChainReader.hpp"
#include "LibrarySession.hpp"
#include "ScanOutput.hpp"
#include "TargetConnection.hpp"

namespace jexjtag::cli {

void runScan(const Options& options, MessageSink& sink, std::ostream& out)
{
    ScanResult result;
    result.target = options.targetType;
    {
        LibrarySession session(options, sink);
        TargetConnection target(session, options);
        if (!options.noLock) target.lock(options.lockWaitMs);
        detectChain(target.handle(), !options.noAutodetect);
        result.devices = readChain(target.handle());
    }
    if (options.json) writeScanJson(out, result);
    else writeScanText(out, result);
}

} // namespace jexjtag::cli
