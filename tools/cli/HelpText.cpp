// SPDX-License-Identifier: MIT
#include "HelpText.hpp"

namespace jexjtag::cli {

namespace {

const char* const kOverviewHead = R"HELP(Usage: jexjtag [OPTIONS] COMMAND [OPTIONS] [OPERANDS]

Reaches JTAG (IEEE 1149.1) boundary-scan chains through libJexJtag and its
cable plug-ins.  Without --target it drives the simulated cable "jtag_sim".

Commands:
)HELP";

const char* const kOverviewTail = R"HELP(
Options for every command:
  -t, --target TYPE      target type to open (default: jtag_sim)
  -a, --arg KEY=VALUE    open argument for the plug-in; repeatable
      --chain CHAIN       the same as --arg chain=CHAIN (jtag_sim: the simulated
                         chain, e.g. 0x4BA00477:4,0x0362D093:6)
      --lock-wait MS     wait up to MS milliseconds for the cable lock
                         (default: 5000; 0 tries once)
      --no-lock          do not take the cable lock
      --datadir DIR      directory of the device database (idcode.lst)
      --log-level N      library log level, 0 (off) to 5 (everything)
      --log-file FILE    append the library log to FILE (default: stderr)
      --json             print the result as JSON on stdout
  -v, --verbose          also show the library's noise and debug messages
  -h, --help             explain the command
      --version          print the program and library versions

Messages from the library go to stderr, prefixed "error: ", "warning: ",
"status: " or "info: ".  Failures end with one line "jexjtag: ..." there.

Exit status: 0 success, 1 the operation failed, 2 usage error.

Examples:
  jexjtag scan
  jexjtag scan --chain 0x4BA00477:4,0x0362D093:6 --json
  jexjtag lookup 0x0362D093
  jexjtag shift ir --device 1 0x09
  jexjtag help shift
)HELP";

constexpr size_t kSynopsisWidth = 19;

} // namespace

std::string overviewText(const std::vector<const Command*>& commands)
{
    std::string text = kOverviewHead;
    for (const Command* command : commands) {
        const std::string synopsis = command->synopsis;
        text += "  " + synopsis;
        if (synopsis.size() + 2 <= kSynopsisWidth) text += std::string(kSynopsisWidth - synopsis.size(), ' ');
        else text += "\n" + std::string(kSynopsisWidth + 2, ' ');
        text += std::string(command->summary) + "\n";
    }
    return text + kOverviewTail;
}

std::string usageHint(const Command* command)
{
    if (!command || std::string(command->name) == "help") return "Try 'jexjtag --help'.";
    return std::string("Try 'jexjtag ") + command->name + " --help'.";
}

} // namespace jexjtag::cli
