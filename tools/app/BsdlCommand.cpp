// SPDX-License-Identifier: MIT
// The "bsdl" command.

#include <vector>

#include "BsdlOutput.hpp"
#include "CliError.hpp"
#include "LibrarySession.hpp"
#include "MessageSink.hpp"
#include "Options.hpp"
#include "jexjtag/jexjtag.h"

namespace jexjtag::cli {

namespace {

const char* const kPage = R"HELP(Usage: jexjtag bsdl FILE [OPTIONS]

Reads a BSDL file and prints the device's entity name, its instruction
register length, its IDCODE register (as the file writes it, X for bits
that do not matter) and the opcode of its BYPASS instruction.

Options:
      --json      {"file", "entity", "ir_length", "idcode", "bypass"}

Examples:
  jexjtag bsdl xc7a35t_csg324.bsd
)HELP";

constexpr unsigned kTextSize = 2048;

void runBsdl(const Options& options, MessageSink& sink, std::ostream& out)
{
    BsdlResult result;
    result.file = options.operands.at(0);
    // The library opens the file once (a FIFO or pipe has one reader) and
    // reports why it cannot read it.
    {
        LibrarySession session(options, sink);
        std::vector<char> entity(kTextSize, '\0');
        std::vector<char> idcode(kTextSize, '\0');
        std::vector<char> bypass(kTextSize, '\0');
        unsigned irLength = 0;
        if (JEX_FAILED(JexJtag_db_parseBSDLFile(session.handle(), result.file.c_str(), entity.data(), kTextSize,
                                                &irLength, idcode.data(), kTextSize, bypass.data(), kTextSize)))
            throw CliError("cannot import BSDL file '" + result.file + "'");
        entity.back() = idcode.back() = bypass.back() = '\0';
        result.entity = entity.data();
        result.irLength = irLength;
        result.idcode = idcode.data();
        result.bypass = bypass.data();
    }
    if (options.json) writeBsdlJson(out, result);
    else writeBsdlText(out, result);
}

} // namespace

extern const Command bsdlCommand = {
    "bsdl", "bsdl FILE", "read a BSDL file: entity, IR length, IDCODE, BYPASS",
    {},
    1, 1, "needs one BSDL file",
    nullptr,
    [] { return std::string(kPage); },
    runBsdl,
};

} // namespace jexjtag::cli
