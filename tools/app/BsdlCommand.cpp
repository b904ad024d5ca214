#include "BsdlCommand.hpp"

#include <vector>

#include "BsdlOutput.hpp"
#include "CliError.hpp"
#include "LibrarySession.hpp"
#include "jexjtag/jexjtag.h"

namespace jexjtag::cli {

namespace {

constexpr unsigned kTextSize = 2048;

} // namespace

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

} // namespace jexjtag::cli
