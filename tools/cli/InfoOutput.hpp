// SPDX-License-Identifier: MIT
#pragma once
// The target information record and the API version, as "info" shows them.

#include <cstdint>
#include <ostream>
#include <string>
#include <utility>
#include <vector>

#include "jexjtag/types.h"

namespace jexjtag::cli {

struct InfoResult {
    unsigned apiVersion = 0;
    std::string apiVersionText; // "Version ..."
    std::string targetType;
    // The record's texts in record order: {"target_name", ...}, ..., {"rawinfo", ...}.
    std::vector<std::pair<std::string, std::string>> fields;
    uint32_t targetFlags = 0;
};

// The record's eleven texts, each read up to its NUL or to the end of its
// 1024 bytes, whichever comes first.
std::vector<std::pair<std::string, std::string>> infoFields(const JexJtagTargetInfo& info);

void writeInfoText(std::ostream& out, const InfoResult& result);
void writeInfoJson(std::ostream& out, const InfoResult& result);

} // namespace jexjtag::cli
