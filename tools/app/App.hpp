// SPDX-License-Identifier: MIT
#pragma once
// The program: parses the command line, runs one command, maps failures to
// the exit status (0 success, 1 operation failed, 2 usage error).

#include <ostream>

namespace jexjtag::cli {

class App {
public:
    static int run(int argc, char** argv, std::ostream& out, std::ostream& err);
};

} // namespace jexjtag::cli
