// SPDX-License-Identifier: MIT
#pragma once
// The target list of "targets", as text and as JSON.

#include <ostream>
#include <string>
#include <vector>

namespace jexjtag::cli {

struct TargetEntry {
    unsigned index = 0;
    std::string name;
    std::string plugin;
    std::string xml; // the plug-in's descriptor text; filled only with --xml
};

struct TargetsResult {
    std::vector<TargetEntry> targets;
    bool withXml = false;
};

void writeTargetsText(std::ostream& out, const TargetsResult& result);
void writeTargetsJson(std::ostream& out, const TargetsResult& result);

} // namespace jexjtag::cli
