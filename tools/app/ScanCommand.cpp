// The "scan" command.

#include "ChainReader.hpp"
#include "LibrarySession.hpp"
#include "MessageSink.hpp"
#include "Options.hpp"
#include "ScanOutput.hpp"
#include "TargetConnection.hpp"

namespace jexjtag::cli {

namespace {

const char* const kPage = R"HELP(Usage: jexjtag scan [OPTIONS]

Opens the target, takes the cable lock, detects the chain (each device's IR
length comes from the device database) and prints one line per device:
its index, IDCODE, IR length and name.  Device 0 is the device nearest TDO.
A device the database does not know is shown as "(unknown)", with the IR
length the library reports for it.

Options:
      --no-autodetect    keep the IR lengths the plug-in found instead of
                         taking them from the device database
      --json             {"target", "count", "devices": [{"index", "idcode",
                         "idcode_bits", "ir_length", "name", "known"}]}
  -t, --target TYPE, -a, --arg KEY=VALUE, --chain CHAIN, --lock-wait MS,
      --no-lock, --datadir DIR, --log-level N: see jexjtag --help

Examples:
  jexjtag scan
  jexjtag scan --chain 0x4BA00477:4,0x0362D093:6
  jexjtag scan --target my_cable --arg port=usb1 --json
)HELP";

void runScan(const Options& options, MessageSink& sink, std::ostream& out)
{
    ScanResult result;
    result.target = options.targetType;
    {
        LibrarySession session(options, sink);
        TargetConnection target(session, options);
        if (!options.noLock) target.lock(options.lockWaitMs);
        detectChain(target.handle(), !options.flag("no-autodetect"));
        result.devices = readChain(target.handle());
    }
    if (options.json) writeScanJson(out, result);
    else writeScanText(out, result);
}

} // namespace

extern const Command scanCommand = {
    "scan", "scan", "open the target, detect the chain and print its devices",
    {{"no-autodetect", 0, false}},
    0, 0, nullptr,
    nullptr,
    [] { return std::string(kPage); },
    runScan,
};

} // namespace jexjtag::cli
