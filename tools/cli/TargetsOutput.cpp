// SPDX-License-Identifier: MIT
#include "TargetsOutput.hpp"

#include "JsonWriter.hpp"
#include "TextTable.hpp"

namespace jexjtag::cli {

void writeTargetsText(std::ostream& out, const TargetsResult& result)
{
    const size_t count = result.targets.size();
    if (count == 0) {
        out << "no targets: no plug-in is installed\n";
        return;
    }
    out << count << (count == 1 ? " target" : " targets") << ":\n";
    TextTable table({true, false, false});
    table.addRow({"#", "TARGET", "PLUGIN"});
    for (const TargetEntry& target : result.targets)
        table.addRow({std::to_string(target.index), target.name, target.plugin});
    table.write(out, "  ");
    if (!result.withXml) return;
    for (const TargetEntry& target : result.targets) {
        out << "\n--- " << target.name << " (" << target.plugin << ") ---\n" << target.xml;
        if (target.xml.empty() || target.xml.back() != '\n') out << '\n';
    }
}

void writeTargetsJson(std::ostream& out, const TargetsResult& result)
{
    JsonWriter json(out);
    json.beginObject();
    json.key("count").number(result.targets.size());
    json.key("targets").beginArray();
    for (const TargetEntry& target : result.targets) {
        json.beginObject();
        json.key("index").number(target.index);
        json.key("name").string(target.name);
        json.key("plugin").string(target.plugin);
        if (result.withXml) json.key("xml").string(target.xml);
        json.endObject();
    }
    json.endArray();
    json.endObject();
    json.finish();
}

} // namespace jexjtag::cli
