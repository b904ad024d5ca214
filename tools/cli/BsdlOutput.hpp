// SPDX-License-Identifier: MIT
#pragma once
// What "bsdl" read from a BSDL file.

#include <ostream>
#include <string>

namespace jexjtag::cli {

struct BsdlResult {
    std::string file;
    std::string entity;
    unsigned irLength = 0;
    std::string idcode; // as the file writes it; empty when the device has none
    std::string bypass; // the BYPASS opcode
};

void writeBsdlText(std::ostream& out, const BsdlResult& result);
void writeBsdlJson(std::ostream& out, const BsdlResult& result);

} // namespace jexjtag::cli
