#pragma once
// Everything the command line says, after parsing.

#include <optional>
#include <string>
#include <vector>

#include "Command.hpp"
#include "jexjtag/types.h"

namespace jexjtag::cli {

constexpr const char* kDefaultTargetType = "jtag_sim";
constexpr unsigned kDefaultLockWaitMs = 5000;
constexpr unsigned kMaxLogLevel = 5;

struct Options {
    Command command = Command::None;
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

    // targets
    bool xml = false;

    // scan, shift
    bool noAutodetect = false;

    // shift
    std::optional<unsigned> device;
    std::optional<unsigned> bits;
    std::optional<std::string> irData; // --ir: instruction shifted before a dr shift
    unsigned exitState = JEXJTAG_RUN_TEST_IDLE;

    // serve
    std::string serveListen; // --listen HOST:PORT
    std::string serveSocket; // --socket PATH
};

} // namespace jexjtag::cli
