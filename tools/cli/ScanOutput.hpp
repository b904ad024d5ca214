// SPDX-License-Identifier: MIT
#pragma once
// The chain found by "scan", as text and as JSON.

#include <ostream>
#include <string>
#include <vector>

namespace jexjtag::cli {

struct ChainDevice {
    unsigned index = 0;
    std::string idcodeBits; // as the library gives it: 32 '0'/'1', MSB first
    unsigned irLength = 0;
    std::string name; // empty: not in the device database
    // Where the IR length comes from: "database", "bsdl" (bsdlFile names the
    // file), "capture" (inferred from the chain's IR capture) or "unknown".
    std::string irLengthSource = "unknown";
    std::string bsdlFile;
};

struct ScanResult {
    std::string target;
    std::vector<ChainDevice> devices;
};

void writeScanText(std::ostream& out, const ScanResult& result);
void writeScanJson(std::ostream& out, const ScanResult& result);

} // namespace jexjtag::cli
