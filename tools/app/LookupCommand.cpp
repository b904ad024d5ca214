// SPDX-License-Identifier: MIT
// The "lookup" command.

#include "CliError.hpp"
#include "Idcode.hpp"
#include "LibrarySession.hpp"
#include "LookupOutput.hpp"
#include "MessageSink.hpp"
#include "Options.hpp"
#include "jexjtag/jexjtag.h"

namespace jexjtag::cli {

namespace {

const char* const kPage = R"HELP(Usage: jexjtag lookup IDCODE [OPTIONS]

Looks a 32-bit IDCODE up in the session's device database and prints the
device name, its IR length and its BYPASS instruction.  An IDCODE that the
database does not know is not an error: it is reported as unknown.

IDCODE is hexadecimal with "0x" (0x0362D093) or binary digits, most
significant first ("0b..." or plain 0/1, up to 32; fewer mean leading zeros).

Options:
      --datadir DIR   read idcode.lst from DIR instead of the installation's
      --json          {"idcode", "idcode_bits", "known", "name", "ir_length", "bypass"}

Examples:
  jexjtag lookup 0x0362D093
  jexjtag lookup 00000011011000101101000010010011
)HELP";

constexpr unsigned kTextSize = 1024;

void runLookup(const Options& options, MessageSink& sink, std::ostream& out)
{
    LookupResult result;
    result.idcode = parseIdcode(options.operands.at(0));
    {
        LibrarySession session(options, sink);
        char name[kTextSize] = {};
        char bypass[kTextSize] = {};
        unsigned irLength = 0;
        if (JEX_FAILED(JexJtag_db_lookupDevice(session.handle(), idcodeBits(result.idcode).c_str(), name, kTextSize,
                                               &irLength, bypass, kTextSize)))
            throw CliError("device database lookup of " + idcodeHex(result.idcode) + " failed");
        name[kTextSize - 1] = '\0';
        bypass[kTextSize - 1] = '\0';
        result.name = name;
        result.irLength = irLength;
        result.bypass = bypass;
    }
    if (options.json) writeLookupJson(out, result);
    else writeLookupText(out, result);
}

} // namespace

extern const Command lookupCommand = {
    "lookup", "lookup IDCODE", "look an IDCODE up in the device database",
    {},
    1, 1, "needs one IDCODE",
    nullptr,
    [] { return std::string(kPage); },
    runLookup,
};

} // namespace jexjtag::cli
