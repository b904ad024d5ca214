// SPDX-License-Identifier: MIT
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

A device the database does not know is named from a BSDL file of the
--bsdl-dir directories whose IDCODE_REGISTER matches (X bits match any), and
gets the file's IR length.  A device neither knows gets the IR length the
chain's IR capture shows (each IR captures binary ...01), with a warning
when the capture leaves it ambiguous.

Options:
      --no-autodetect    keep the IR lengths the plug-in found instead of
                         taking them from the device database
      --bsdl-dir DIR     a directory of BSDL files (.bsd, .bsdl, .bsm) to
                         name unknown devices from; may be repeated
      --json             {"target", "count", "devices": [{"index", "idcode",
                         "idcode_bits", "ir_length", "name", "known",
                         "ir_length_source", "bsdl_file"}]}; ir_length_source
                         is "database", "bsdl" (with bsdl_file), "capture"
                         or "unknown"
  -t, --target TYPE, -a, --arg KEY=VALUE, --chain CHAIN, --lock-wait MS,
      --no-lock, --datadir DIR, --log-level N: see jexjtag --help

Examples:
  jexjtag scan
  jexjtag scan --chain 0x4BA00477:4,0x0362D093:6
  jexjtag scan --target my_cable --arg port=usb1 --json
  jexjtag scan --bsdl-dir /usr/share/bsdl
)HELP";

void runScan(const Options& options, MessageSink& sink, std::ostream& out)
{
    ScanResult result;
    result.target = options.targetType;
    {
        LibrarySession session(options, sink);
        TargetConnection target(session, options);
        if (!options.noLock) target.lock(options.lockWaitMs);
        const bool autodetect = !options.flag("no-autodetect");
        detectChain(target.handle(), autodetect);
        result.devices = readChain(target.handle());
        if (!autodetect) // the plug-in's own lengths, from its IR capture
            for (ChainDevice& device : result.devices) device.irLengthSource = device.irLength ? "capture" : "unknown";
        nameFromBsdl(target.handle(), options.values("bsdl-dir"), result.devices);
        inferIrLengths(target.handle(), result.devices, sink);
    }
    if (options.json) writeScanJson(out, result);
    else writeScanText(out, result);
}

} // namespace

extern const Command scanCommand = {
    "scan", "scan", "open the target, detect the chain and print its devices",
    {{"no-autodetect", 0, false}, {"bsdl-dir", 0, true, checkNonEmptyValue}},
    0, 0, nullptr,
    nullptr,
    [] { return std::string(kPage); },
    runScan,
};

} // namespace jexjtag::cli
