// SPDX-License-Identifier: MIT
#pragma once
// The pins of one device as "pins" prints them, as text and as JSON.

#include <ostream>
#include <string>
#include <vector>

namespace jexjtag::cli {

struct PinRow {
    std::string port;     // "IO(0)"
    std::string pin;      // package pin, "" when unmapped
    std::string function; // "bidir", "input", ...
    int cell = -1;
    int level = -1;       // 0, 1; -1: no capturing cell
};

struct PinsResult {
    unsigned device = 0;
    std::string entity;
    std::string instruction; // "SAMPLE", "EXTEST"
    std::vector<PinRow> pins;
};

void writePinsText(std::ostream& out, const PinsResult& result);
// {"device": N, "pins": [{"port", "pin", "function", "cell", "level"}]}
void writePinsJson(std::ostream& out, const PinsResult& result);
// One line per pin whose level differs between before and after:
// "IO(0) (pin 9): 0 -> 1".
void writePinChanges(std::ostream& out, const PinsResult& before, const PinsResult& after);

} // namespace jexjtag::cli
