#include "ArgParser.hpp"

#include <cctype>

#include "DataText.hpp"
#include "NumberText.hpp"
#include "TapStateName.hpp"
#include "UsageError.hpp"

namespace jexjtag::cli {

namespace {

enum class Id {
    Help,
    Version,
    Json,
    Verbose,
    Target,
    Arg,
    Chain,
    LockWait,
    NoLock,
    LogLevel,
    LogFile,
    DataDir,
    Xml,
    NoAutodetect,
    Device,
    Bits,
    Exit,
    Ir,
    Listen,
    Socket
};

// Which commands an option applies to; kAll for the global ones.
enum : unsigned {
    kTargets = 1u << 0,
    kScan = 1u << 1,
    kShift = 1u << 2,
    kServe = 1u << 3,
    kAll = ~0u,
};

struct OptionSpec {
    Id id;
    const char* longName;
    char shortName;
    bool takesValue;
    unsigned commands;
};

const OptionSpec kOptions[] = {
    {Id::Help, "help", 'h', false, kAll},
    {Id::Version, "version", 0, false, kAll},
    {Id::Json, "json", 0, false, kAll},
    {Id::Verbose, "verbose", 'v', false, kAll},
    {Id::Target, "target", 't', true, kAll},
    {Id::Arg, "arg", 'a', true, kAll},
    {Id::Chain, "chain", 0, true, kAll},
    {Id::LockWait, "lock-wait", 0, true, kAll},
    {Id::NoLock, "no-lock", 0, false, kAll},
    {Id::LogLevel, "log-level", 0, true, kAll},
    {Id::LogFile, "log-file", 0, true, kAll},
    {Id::DataDir, "datadir", 0, true, kAll},
    {Id::Xml, "xml", 0, false, kTargets},
    {Id::NoAutodetect, "no-autodetect", 0, false, kScan | kShift},
    {Id::Device, "device", 'd', true, kShift},
    {Id::Bits, "bits", 'n', true, kShift},
    {Id::Exit, "exit", 0, true, kShift},
    {Id::Ir, "ir", 0, true, kShift},
    {Id::Listen, "listen", 0, true, kServe},
    {Id::Socket, "socket", 0, true, kServe},
};

unsigned commandBit(Command command)
{
    switch (command) {
    case Command::Targets: return kTargets;
    case Command::Scan: return kScan;
    case Command::Shift: return kShift;
    case Command::Serve: return kServe;
    default: return 0;
    }
}

const OptionSpec* findLong(const std::string& name)
{
    for (const OptionSpec& option : kOptions)
        if (name == option.longName) return &option;
    return nullptr;
}

const OptionSpec* findShort(char name)
{
    for (const OptionSpec& option : kOptions)
        if (option.shortName != 0 && option.shortName == name) return &option;
    return nullptr;
}

std::string displayName(const OptionSpec& option) { return std::string("--") + option.longName; }

unsigned numberValue(const OptionSpec& option, const std::string& value, unsigned maximum = 0xFFFFFFFFu)
{
    const auto number = parseUnsigned(value, maximum);
    if (!number)
        throw UsageError(displayName(option) + " needs a number" +
                         (maximum != 0xFFFFFFFFu ? " from 0 to " + std::to_string(maximum) : std::string()) +
                         ", not '" + value + "'");
    return *number;
}

void apply(Options& options, const OptionSpec& option, const std::string& value)
{
    switch (option.id) {
    case Id::Help: options.help = true; break;
    case Id::Version: options.version = true; break;
    case Id::Json: options.json = true; break;
    case Id::Verbose: options.verbose = true; break;
    case Id::Target:
        if (value.empty()) throw UsageError("--target needs a target type name");
        options.targetType = value;
        break;
    case Id::Arg: {
        const size_t eq = value.find('=');
        if (eq == std::string::npos || eq == 0)
            throw UsageError("--arg needs KEY=VALUE, not '" + value + "'");
        options.targetArgs.push_back(value);
        break;
    }
    case Id::Chain:
        if (value.empty()) throw UsageError("--chain needs a chain description such as 0x4BA00477:4,0x0362D093:6");
        options.targetArgs.push_back("chain=" + value);
        break;
    case Id::LockWait: options.lockWaitMs = numberValue(option, value); break;
    case Id::NoLock: options.noLock = true; break;
    case Id::LogLevel: options.logLevel = numberValue(option, value, kMaxLogLevel); break;
    case Id::LogFile:
        if (value.empty()) throw UsageError("--log-file needs a file name");
        options.logFile = value;
        break;
    case Id::DataDir:
        if (value.empty()) throw UsageError("--datadir needs a directory");
        options.dataDir = value;
        break;
    case Id::Xml: options.xml = true; break;
    case Id::NoAutodetect: options.noAutodetect = true; break;
    case Id::Device: options.device = numberValue(option, value); break;
    case Id::Bits: options.bits = numberValue(option, value); break;
    case Id::Exit: options.exitState = parseTapState(value); break;
    case Id::Ir:
        if (value.empty()) throw UsageError("--ir needs the instruction to shift");
        options.irData = value;
        break;
    case Id::Listen:
        if (value.empty()) throw UsageError("--listen needs HOST:PORT");
        options.serveListen = value;
        break;
    case Id::Socket:
        if (value.empty()) throw UsageError("--socket needs the path of a Unix socket");
        options.serveSocket = value;
        break;
    }
}

void checkOperands(Options& options)
{
    const std::string name = commandName(options.command);
    const size_t count = options.operands.size();
    const auto expect = [&](size_t minimum, size_t maximum, const char* what) {
        if (count < minimum || count > maximum)
            throw UsageError("'" + name + "' " + what + " (" + std::to_string(count) + " given)");
    };
    switch (options.command) {
    case Command::None:
        throw UsageError("no command given");
    case Command::Help:
        expect(0, 1, "takes at most one command name");
        if (count == 1 && !commandFromName(options.operands[0]))
            throw UsageError("unknown command '" + options.operands[0] + "'");
        break;
    case Command::Targets:
    case Command::Scan:
    case Command::Info:
        expect(0, 0, "takes no operands");
        break;
    case Command::Serve:
        expect(0, 0, "takes no operands");
        if (!options.serveListen.empty() && !options.serveSocket.empty())
            throw UsageError("'serve' takes --listen or --socket, not both");
        break;
    case Command::Lookup:
        expect(1, 1, "needs one IDCODE");
        break;
    case Command::Bsdl:
        expect(1, 1, "needs one BSDL file");
        break;
    case Command::Shift: {
        expect(1, 2, "needs ir or dr and the data to shift");
        std::string reg = options.operands[0];
        for (char& c : reg) c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
        if (reg != "ir" && reg != "dr")
            throw UsageError("'shift' needs ir or dr first, not '" + options.operands[0] + "'");
        options.operands[0] = reg;
        if (options.bits && (*options.bits == 0 || *options.bits > kMaxDataBits))
            throw UsageError("--bits needs a length from 1 to " + std::to_string(kMaxDataBits));
        if (count == 1 && !options.bits) throw UsageError("'shift' needs data to shift, or --bits N to read only");
        if (options.irData && reg == "ir") throw UsageError("--ir goes with 'shift dr' only");
        break;
    }
    }
}

} // namespace

Options ArgParser::parse(const std::vector<std::string>& args)
{
    Options options;
    std::vector<const OptionSpec*> given;
    bool optionsEnded = false;
    for (size_t i = 0; i < args.size(); ++i) {
        const std::string& arg = args[i];
        if (!optionsEnded && arg == "--") {
            optionsEnded = true;
            continue;
        }
        const bool isLong = !optionsEnded && arg.size() > 2 && arg.compare(0, 2, "--") == 0;
        const bool isShort = !optionsEnded && !isLong && arg.size() == 2 && arg[0] == '-' && arg[1] != '-';
        if (!isLong && !isShort) {
            if (!optionsEnded && arg.size() > 1 && arg[0] == '-')
                throw UsageError("unknown option '" + arg + "'");
            if (options.command == Command::None) {
                const auto command = commandFromName(arg);
                if (!command) throw UsageError("unknown command '" + arg + "'");
                options.command = *command;
            } else {
                options.operands.push_back(arg);
            }
            continue;
        }

        std::string name = isLong ? arg.substr(2) : arg.substr(1);
        std::string value;
        bool hasValue = false;
        if (isLong) {
            const size_t eq = name.find('=');
            if (eq != std::string::npos) {
                value = name.substr(eq + 1);
                name.erase(eq);
                hasValue = true;
            }
        }
        const OptionSpec* option = isLong ? findLong(name) : findShort(name[0]);
        if (!option) throw UsageError("unknown option '" + (isLong ? "--" + name : arg) + "'");
        if (option->takesValue && !hasValue) {
            if (i + 1 >= args.size()) throw UsageError(displayName(*option) + " needs a value");
            value = args[++i];
        } else if (!option->takesValue && hasValue) {
            throw UsageError(displayName(*option) + " takes no value");
        }
        apply(options, *option, value);
        given.push_back(option);
    }

    for (const OptionSpec* option : given)
        if (option->commands != kAll && options.command != Command::None &&
            (option->commands & commandBit(options.command)) == 0)
            throw UsageError("option " + displayName(*option) + " does not apply to '" + commandName(options.command) +
                             "'");
    if (options.help || options.version) return options;
    checkOperands(options);
    return options;
}

} // namespace jexjtag::cli
