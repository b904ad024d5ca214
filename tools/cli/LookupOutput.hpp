// SPDX-License-Identifier: MIT
#pragma once
// One device database entry, as "lookup" shows it.

#include <cstdint>
#include <ostream>
#include <string>

namespace jexjtag::cli {

struct LookupResult {
    uint32_t idcode = 0;
    std::string name; // empty: not in the device database
    unsigned irLength = 0;
    std::string bypass; // one '1' per IR bit
};

void writeLookupText(std::ostream& out, const LookupResult& result);
void writeLookupJson(std::ostream& out, const LookupResult& result);

} // namespace jexjtag::cli
