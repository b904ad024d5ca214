// SPDX-License-Identifier: MIT
// The "pins" command.

#include <cerrno>
#include <chrono>
#include <cstdio>
#include <cstring>
#include <thread>
#include <vector>

#include "ChainReader.hpp"
#include "CliError.hpp"
#include "LibrarySession.hpp"
#include "MessageSink.hpp"
#include "Options.hpp"
#include "PinsOutput.hpp"
#include "TargetConnection.hpp"
#include "UsageError.hpp"
#include "jexjtag/jexjtag.h"

namespace jexjtag::cli {

namespace {

const char* const kPage = R"HELP(Usage: jexjtag pins --device N --bsdl FILE [OPTIONS] [PORT=LEVEL ...]

Reads the pins of device N through its boundary register (SAMPLE), as the
BSDL file describes it, and prints every port that has a boundary cell: its
package pin, its function, the cell that drives it (else the one that
captures it) and its level (- when the pin has no capturing cell).  The
other devices of the chain stay in BYPASS.

With --set, drives pins through EXTEST instead: each PORT=LEVEL (a port
element such as IO(0), or a package pin; LEVEL 0, 1 or z for released) is
driven, every other output cell holds its safe value, control cells are set
to match; the levels shown are those read under EXTEST, and the device stays
in EXTEST.  More settings may follow as operands.

Options:
  -d, --device N         the device, 0 nearest TDO (required)
      --bsdl FILE        the device's BSDL file (required)
      --set PORT=LEVEL   drive a pin through EXTEST; may be repeated
      --highz            put the device in HIGHZ (every output released)
      --watch            sample again and again and print the pins that change
      --interval MS      time between samples of --watch (default 500)
      --count N          samples of --watch after the first (default: until
                         interrupted)
      --no-autodetect    keep the IR lengths the plug-in found
      --json             {"device": N, "pins": [{"port", "pin", "function",
                         "cell", "level"}]}; level is 0, 1 or null
  -t, --target TYPE, -a, --arg KEY=VALUE, --chain CHAIN, --lock-wait MS,
      --no-lock, --datadir DIR, --log-level N: see jexjtag --help

Examples:
  jexjtag pins --device 1 --bsdl part.bsd
  jexjtag pins -d 1 --bsdl part.bsd --set 'IO(0)=1' 'IO(1)=z'
  jexjtag pins -d 1 --bsdl part.bsd --watch --interval 100
)HELP";

constexpr unsigned kDefaultIntervalMs = 500;

struct Setting {
    std::string pin;
    char level;
};

std::vector<Setting> readSettings(const Options& options)
{
    std::vector<std::string> texts = options.values("set");
    texts.insert(texts.end(), options.operands.begin(), options.operands.end());
    std::vector<Setting> settings;
    for (const std::string& text : texts) {
        const size_t eq = text.rfind('=');
        const std::string level = eq == std::string::npos ? "" : text.substr(eq + 1);
        if (eq == 0 || (level != "0" && level != "1" && level != "z" && level != "Z"))
            throw UsageError("'" + text + "' is not PORT=0, PORT=1 or PORT=z");
        settings.push_back({text.substr(0, eq), level[0]});
    }
    return settings;
}

void checkPins(const Options& options)
{
    if (!options.value("device")) throw UsageError("'pins' needs --device N");
    if (!options.value("bsdl")) throw UsageError("'pins' needs --bsdl FILE");
    const std::vector<Setting> settings = readSettings(options);
    if (!options.operands.empty() && !options.flag("set"))
        throw UsageError("pin settings as operands need --set");
    const int modes = (settings.empty() ? 0 : 1) + (options.flag("highz") ? 1 : 0) + (options.flag("watch") ? 1 : 0);
    if (modes > 1) throw UsageError("--set, --highz and --watch go one at a time");
    if (options.flag("watch") && options.json) throw UsageError("--watch prints text, not --json");
}

// The pin table of a part, levels unset.
PinsResult pinTable(unsigned handle, unsigned part, unsigned device)
{
    JexBsdlSummary summary;
    if (JEX_FAILED(JexJtag_bsdl_getSummary(handle, part, &summary))) throw CliError("cannot read the BSDL part");
    PinsResult result;
    result.device = device;
    result.entity = summary.entity;
    for (unsigned i = 0; i < summary.pinCount; ++i) {
        JexBsdlPin pin;
        if (JEX_FAILED(JexJtag_bsdl_getPin(handle, part, i, &pin))) throw CliError("cannot read the BSDL part");
        result.pins.push_back({pin.port, pin.pin, JexJtag_bsdl_functionName(pin.function), pin.cell, -1});
    }
    return result;
}

void takeLevels(PinsResult& result, const std::vector<signed char>& levels)
{
    for (size_t i = 0; i < result.pins.size(); ++i) result.pins[i].level = levels[i];
}

void sample(unsigned handle, unsigned part, PinsResult& result)
{
    std::vector<signed char> levels(result.pins.size() + 1, -1);
    if (JEX_FAILED(JexJtag_bsdl_sample(handle, result.device, part, levels.data(),
                                       static_cast<unsigned>(levels.size()), nullptr, 0)))
        throw CliError("SAMPLE of device " + std::to_string(result.device) + " failed");
    takeLevels(result, levels);
    result.instruction = "SAMPLE";
}

void runPins(const Options& options, MessageSink& sink, std::ostream& out)
{
    const unsigned device = *options.number("device");
    const std::string file = *options.value("bsdl");
    const std::vector<Setting> settings = readSettings(options);
    if (std::FILE* f = std::fopen(file.c_str(), "rb")) std::fclose(f);
    else throw CliError("cannot read BSDL file '" + file + "': " + std::strerror(errno));

    LibrarySession session(options, sink);
    TargetConnection target(session, options);
    if (!options.noLock) target.lock(options.lockWaitMs);
    const unsigned handle = target.handle();
    detectChain(handle, !options.flag("no-autodetect"));
    const unsigned count = chainDeviceCount(handle);
    if (device >= count)
        throw CliError("device " + std::to_string(device) + " is outside the chain of " + std::to_string(count) +
                       (count == 1 ? " device" : " devices"));
    unsigned part = 0;
    if (JEX_FAILED(JexJtag_bsdl_open(session.handle(), file.c_str(), &part)))
        throw CliError("cannot read BSDL file '" + file + "'");
    // The device's IR length is the file's; devices nobody knows get theirs
    // from the IR capture, so the padding of device shifts is right.
    JexBsdlSummary summary;
    if (JEX_FAILED(JexJtag_bsdl_getSummary(handle, part, &summary)) ||
        JEX_FAILED(JexJtag_tap_setIRLength(handle, device, summary.irLength)))
        throw CliError("cannot set the IR length of device " + std::to_string(device));
    std::vector<ChainDevice> devices = readChain(handle);
    inferIrLengths(handle, devices, sink);
    const std::string pattern = summary.idcode;
    const std::string& bits = devices[device].idcodeBits;
    bool matches = pattern.size() == bits.size();
    for (size_t i = 0; matches && i < pattern.size(); ++i)
        matches = pattern[i] == 'X' || pattern[i] == 'x' || pattern[i] == bits[i];
    if (!pattern.empty() && !matches)
        sink.deliver(JEX_MSG_WARNING, ("device " + std::to_string(device) + " has IDCODE " + bits + ", which " +
                                       file + " (" + summary.entity + ", " + pattern + ") does not describe")
                                          .c_str());

    PinsResult result = pinTable(handle, part, device);
    if (options.flag("highz")) {
        if (JEX_FAILED(JexJtag_bsdl_highz(handle, device, part)))
            throw CliError("HIGHZ of device " + std::to_string(device) + " failed");
        if (options.json) {
            writePinsJson(out, result);
        } else {
            out << "device " << device << " (" << result.entity << "): HIGHZ, every output released\n";
        }
        return;
    }
    if (!settings.empty()) {
        std::vector<const char*> pins;
        std::string values;
        for (const Setting& s : settings) {
            pins.push_back(s.pin.c_str());
            values += s.level;
        }
        std::vector<signed char> levels(result.pins.size() + 1, -1);
        if (JEX_FAILED(JexJtag_bsdl_extest(handle, device, part, static_cast<unsigned>(pins.size()), pins.data(),
                                           values.data(), levels.data(), static_cast<unsigned>(levels.size()))))
            throw CliError("EXTEST of device " + std::to_string(device) + " failed");
        takeLevels(result, levels);
        result.instruction = "EXTEST";
    } else {
        sample(handle, part, result);
    }
    if (options.json) writePinsJson(out, result);
    else writePinsText(out, result);
    if (!options.flag("watch")) return;

    const unsigned interval = options.number("interval").value_or(kDefaultIntervalMs);
    const std::optional<unsigned> samples = options.number("count");
    out.flush();
    for (unsigned n = 0; !samples || n < *samples; ++n) {
        std::this_thread::sleep_for(std::chrono::milliseconds(interval));
        PinsResult next = result;
        sample(handle, part, next);
        writePinChanges(out, result, next);
        result = std::move(next);
    }
}

} // namespace

extern const Command pinsCommand = {
    "pins", "pins --bsdl FILE", "read (SAMPLE) or drive (EXTEST) the pins of device --device N",
    {
        {"device", 'd', true, checkNumberValue},
        {"bsdl", 0, true, checkNonEmptyValue},
        {"set", 0, true, checkNonEmptyValue},
        {"highz", 0, false},
        {"watch", 0, false},
        {"interval", 0, true, checkNumberValue},
        {"count", 0, true, checkNumberValue},
        {"no-autodetect", 0, false},
    },
    0, 0xFFFFu, "takes pin settings (PORT=LEVEL) only with --set",
    checkPins,
    [] { return std::string(kPage); },
    runPins,
};

} // namespace jexjtag::cli
