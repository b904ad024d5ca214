#include "HelpText.hpp"

#include "TapStateName.hpp"

namespace jexjtag::cli {

namespace {

const char* const kOverview = R"HELP(Usage: jexjtag [OPTIONS] COMMAND [OPTIONS] [OPERANDS]

Reaches JTAG (IEEE 1149.1) boundary-scan chains through libJexJtag and its
cable plug-ins.  Without --target it drives the simulated cable "jtag_sim".

Commands:
  targets            list the target types the installed plug-ins offer
  scan               open the target, detect the chain and print its devices
  lookup IDCODE      look an IDCODE up in the device database
  bsdl FILE          read a BSDL file: entity, IR length, IDCODE, BYPASS
  shift ir|dr DATA   shift an instruction or data register and print TDO
  info               print the target's information record and the API version
  serve              serve the target to remote_bitbang clients (OpenOCD)
  help [COMMAND]     print this text, or the page of one command

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

const char* const kTargets = R"HELP(Usage: jexjtag targets [--xml] [OPTIONS]

Lists the target types that the installed plug-ins offer, in discovery
order, each with the name of the plug-in that serves it.

Options:
      --xml       also print each plug-in's descriptor text
      --json      {"count": N, "targets": [{"index", "name", "plugin"[, "xml"]}]}
      --datadir DIR, --log-level N, --log-file FILE, --verbose: see jexjtag --help

Examples:
  jexjtag targets
  jexjtag targets --xml
)HELP";

const char* const kScan = R"HELP(Usage: jexjtag scan [OPTIONS]

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

const char* const kLookup = R"HELP(Usage: jexjtag lookup IDCODE [OPTIONS]

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

const char* const kBsdl = R"HELP(Usage: jexjtag bsdl FILE [OPTIONS]

Reads a BSDL file and prints the device's entity name, its instruction
register length, its IDCODE register (as the file writes it, X for bits
that do not matter) and the opcode of its BYPASS instruction.

Options:
      --json      {"file", "entity", "ir_length", "idcode", "bypass"}

Examples:
  jexjtag bsdl xc7a35t_csg324.bsd
)HELP";

const char* const kInfo = R"HELP(Usage: jexjtag info [OPTIONS]

Opens the target and prints its information record (names, versions,
vendor, frequency, port, flags) and the library's API version.

Options:
      --json      {"api_version", "api_version_text", "target": {...}}
  -t, --target TYPE, -a, --arg KEY=VALUE, --chain CHAIN: see jexjtag --help

Examples:
  jexjtag info
  jexjtag info --target jtag_sim --arg new_firmware=1 --json
)HELP";

const char* const kShiftHead = R"HELP(Usage: jexjtag shift ir|dr [DATA] [OPTIONS]

Opens the target, takes the cable lock and shifts DATA through the
instruction register (ir) or the data register path (dr), then prints
what came out of TDO in the notation DATA was written in.

  With --device N the shift addresses device N alone (device 0 is nearest
  TDO; the other devices are put in BYPASS): the chain is detected first.
  An ir shift of one device takes that device's IR length: hexadecimal
  DATA without --bits is fitted to it (0x09 becomes 6 bits for a 6-bit IR).
  Without --device the whole chain is shifted.

DATA is a number written most significant bit first; its LAST digit (the
least significant bit) is shifted FIRST:
  0x1F       hexadecimal: 4 bits per digit written, leading zeros count
             (0x01F is 12 bits)
  0b10110    binary: one bit per digit
  10110      binary without prefix
'_' may separate digits (0x4BA0_0477).  TDO is printed the same way: its
last digit is the first bit that came out.

Options:
  -d, --device N     shift device N's register instead of the whole chain
  -n, --bits N       the length in bits: DATA is widened with zeros or
                     narrowed by dropping leading zeros (a 1 may not be
                     dropped); without DATA, N bits are only read (TDI 0)
      --exit STATE   TAP state to end in (default: RUN_TEST_IDLE)
      --ir INSTR     dr only: first shift INSTR into the instruction
                     register (device N's with --device; same notation and
                     fitting as an ir shift), ending in RUN_TEST_IDLE.
                     Each run opens the target anew, so an instruction a dr
                     shift depends on is loaded in the same run this way.
      --no-autodetect  with --device: keep the IR lengths the plug-in found
      --json         {"register", "device", "bits", "exit_state", "tdi",
                     "tdo", "tdo_bits", "instruction": {"bits", "tdi", "tdo"}}
  -t, --target TYPE, -a, --arg KEY=VALUE, --chain CHAIN, --lock-wait MS:
                     see jexjtag --help

STATE is one of )HELP";

const char* const kShiftTail = R"HELP(,
with or without the prefix JEXJTAG_, in any case, '-' for '_'
(pause-dr), or its number 0..15.

Examples:
  jexjtag shift ir --device 1 0x09        IDCODE instruction into device 1
  jexjtag shift dr --device 1 --ir 0x09 --bits 32
                                          read device 1's IDCODE register
  jexjtag shift dr 0b1011 --exit pause-dr
  jexjtag shift dr --bits 96 --json       the whole chain's data registers
)HELP";

const char* const kServe = R"HELP(Usage: jexjtag serve [--listen HOST:PORT | --socket PATH] [OPTIONS]

Opens the target, takes the cable lock and serves the chain as a
remote_bitbang server, so that OpenOCD and other remote_bitbang clients can
use it.  Prints one line "listening on HOST:PORT" (or "listening on PATH")
when ready.  One client at a time; others wait.  Ctrl-C or SIGTERM ends it
and releases the cable.

Options:
      --listen HOST:PORT  TCP address (default 127.0.0.1:0, 0 = any free port)
      --socket PATH       a Unix-domain socket instead of TCP
  -t, --target TYPE, -a, --arg KEY=VALUE, --chain CHAIN, --lock-wait MS,
  --no-lock, --datadir DIR, --log-level N, --log-file FILE, --verbose:
                          see jexjtag --help

OpenOCD as the client:
  openocd -c "adapter driver remote_bitbang" -c "remote_bitbang host 127.0.0.1"
          -c "remote_bitbang port PORT" -c "transport select jtag" ...
)HELP";

} // namespace

std::string helpText(Command command)
{
    switch (command) {
    case Command::None:
    case Command::Help: return kOverview;
    case Command::Targets: return kTargets;
    case Command::Scan: return kScan;
    case Command::Lookup: return kLookup;
    case Command::Bsdl: return kBsdl;
    case Command::Info: return kInfo;
    case Command::Serve: return kServe;
    case Command::Shift: return std::string(kShiftHead) + tapStateNameList() + kShiftTail;
    }
    return kOverview;
}

std::string usageHint(Command command)
{
    if (command == Command::None || command == Command::Help) return "Try 'jexjtag --help'.";
    return std::string("Try 'jexjtag ") + commandName(command) + " --help'.";
}

} // namespace jexjtag::cli
