// SPDX-License-Identifier: MIT
#pragma once
// Everything the command line says, after parsing.

#include <map>
#include <optional>
#include <string>
#include <vector>

#include "Command.hpp"

namespace jexjtag::cli {

constexpr const char* kDefaultTargetType = "jtag_sim";
constexpr unsigned kDefaultLockWaitMs = 5000;
constexpr unsigned kMaxLogLevel = 5;

struct Options {
    const Command* command = nullptr; // null: no command given
    std::vector<std::string> operands; // after the command name

    // Program
    bool help = false;
    bool version = false;
    bool json = false;
    bool verbose = false;

    // Library session
    std::string dataDir;              // --datadir: session argument "datadir=DIR"
    std::optional<unsigned> logLevel; // --log-level: JEXJTAG_LOG_LEVEL
    std::string logFile;              // --log-file: JEXJTAG_LOG_FILE

    // Target
    std::string targetType = kDefaultTargetType;
    std::vector<std::string> targetArgs; // "key=value", in the order given
    unsigned lockWaitMs = kDefaultLockWaitMs;
    bool noLock = false;

    // The command's own options, by long name: every value given, in order
    // ("" for each use of a flag).
    std::map<std::string, std::vector<std::string>> commandValues;

    // Whether the command's option --name was given.
    bool flag(const std::string& name) const;
    // The last value given to --name, or none.
    std::optional<std::string> value(const std::string& name) const;
    // Every value given to --name, in order (empty when not given).
    std::vector<std::string> values(const std::string& name) const;
    // The last value of --name as a decimal number up to maximum, or none
    // when not given; anything else throws UsageError "--name needs a
    // number[ from 0 to maximum], not 'value'".
    std::optional<unsigned> number(const std::string& name, unsigned maximum = 0xFFFFFFFFu) const;
};

// value as a decimal number up to maximum, for option --name; throws
// UsageError as Options::number does.
unsigned optionNumber(const std::string& name, const std::string& value, unsigned maximum = 0xFFFFFFFFu);

// CommandOption::checkValue for options that take a decimal number.
void checkNumberValue(const std::string& name, const std::string& value);
// CommandOption::checkValue for options whose value may not be empty:
// "--name needs a value".
void checkNonEmptyValue(const std::string& name, const std::string& value);

} // namespace jexjtag::cli
