#include "LookupCommand.hpp"

#include "CliError.hpp"
#include "Idcode.hpp"
#include "LibrarySession.hpp"
#include "LookupOutput.hpp"
#include "jexjtag/jexjtag.h"

namespace jexjtag::cli {

namespace {

constexpr unsigned kTextSize = 1024;

} // namespace

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

} // namespace jexjtag::cli
