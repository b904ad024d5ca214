// SPDX-License-Identifier: MIT
#include "ArgParser.hpp"

#include "UsageError.hpp"

namespace jexjtag::cli {

namespace {

// The options every command takes.  A command's own options are in its
// entry (Command::options).
enum class Id { Help, Version, Json, Verbose, Target, Arg, Chain, LockWait, NoLock, LogLevel, LogFile, DataDir };

struct GlobalOption {
    Id id;
    const char* longName;
    char shortName;
    bool takesValue;
};

const GlobalOption kGlobalOptions[] = {
    {Id::Help, "help", 'h', false},          {Id::Version, "version", 0, false},
    {Id::Json, "json", 0, false},            {Id::Verbose, "verbose", 'v', false},
    {Id::Target, "target", 't', true},       {Id::Arg, "arg", 'a', true},
    {Id::Chain, "chain", 0, true},           {Id::LockWait, "lock-wait", 0, true},
    {Id::NoLock, "no-lock", 0, false},       {Id::LogLevel, "log-level", 0, true},
    {Id::LogFile, "log-file", 0, true},      {Id::DataDir, "datadir", 0, true},
};

const GlobalOption* findGlobal(const std::string& longName, char shortName)
{
    for (const GlobalOption& option : kGlobalOptions)
        if (shortName != 0 ? option.shortName == shortName : longName == option.longName) return &option;
    return nullptr;
}

// A command's option: that of the command given so far, else the first
// command that has one of this name (it may not apply: checked at the end).
const CommandOption* findCommandOption(const std::vector<const Command*>& commands, const Command* given,
                                       const std::string& longName, char shortName)
{
    const auto find = [&](const Command& command) {
        return shortName != 0 ? command.findShortOption(shortName) : command.findOption(longName);
    };
    if (given)
        if (const CommandOption* option = find(*given)) return option;
    for (const Command* command : commands)
        if (const CommandOption* option = find(*command)) return option;
    return nullptr;
}

void apply(Options& options, const GlobalOption& option, const std::string& value)
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
    case Id::LockWait: options.lockWaitMs = optionNumber(option.longName, value); break;
    case Id::NoLock: options.noLock = true; break;
    case Id::LogLevel: options.logLevel = optionNumber(option.longName, value, kMaxLogLevel); break;
    case Id::LogFile:
        if (value.empty()) throw UsageError("--log-file needs a file name");
        options.logFile = value;
        break;
    case Id::DataDir:
        if (value.empty()) throw UsageError("--datadir needs a directory");
        options.dataDir = value;
        break;
    }
}

void checkOperands(const Options& options)
{
    const Command& command = *options.command;
    const size_t count = options.operands.size();
    if (count < command.minOperands || count > command.maxOperands)
        throw UsageError(std::string("'") + command.name + "' " +
                         (command.operandRule ? command.operandRule : "takes no operands") + " (" +
                         std::to_string(count) + " given)");
    if (command.check) command.check(options);
}

} // namespace

Options ArgParser::parse(const std::vector<std::string>& args, const std::vector<const Command*>& commands)
{
    Options options;
    std::vector<std::string> commandOptionsGiven;
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
            if (!options.command) {
                options.command = findCommand(commands, arg);
                if (!options.command) throw UsageError("unknown command '" + arg + "'");
            } else {
                options.operands.push_back(arg);
            }
            continue;
        }

        std::string name = isLong ? arg.substr(2) : std::string();
        const char shortName = isLong ? 0 : arg[1];
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
        const GlobalOption* global = findGlobal(name, shortName);
        const CommandOption* own = global ? nullptr : findCommandOption(commands, options.command, name, shortName);
        if (!global && !own) throw UsageError("unknown option '" + (isLong ? "--" + name : arg) + "'");
        const std::string longName = global ? global->longName : own->longName;
        const bool takesValue = global ? global->takesValue : own->takesValue;
        if (takesValue && !hasValue) {
            if (i + 1 >= args.size()) throw UsageError("--" + longName + " needs a value");
            value = args[++i];
        } else if (!takesValue && hasValue) {
            throw UsageError("--" + longName + " takes no value");
        }
        if (global) {
            apply(options, *global, value);
        } else {
            if (own->checkValue) own->checkValue(longName, value);
            options.commandValues[longName].push_back(value);
            commandOptionsGiven.push_back(longName);
        }
    }

    for (const std::string& longName : commandOptionsGiven)
        if (options.command && !options.command->findOption(longName))
            throw UsageError("option --" + longName + " does not apply to '" + options.command->name + "'");
    if (options.help || options.version) return options;
    if (!options.command) throw UsageError("no command given");
    checkOperands(options);
    return options;
}

} // namespace jexjtag::cli
