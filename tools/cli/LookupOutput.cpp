// SPDX-License-Identifier: MIT
#include "LookupOutput.hpp"

#include "Idcode.hpp"
#include "JsonWriter.hpp"
#include "TextTable.hpp"

namespace jexjtag::cli {

void writeLookupText(std::ostream& out, const LookupResult& result)
{
    TextTable table;
    table.addRow({"IDCODE", idcodeHex(result.idcode)});
    if (result.name.empty()) {
        table.addRow({"Device", "(unknown: not in the device database)"});
    } else {
        table.addRow({"Device", result.name});
        table.addRow({"IR length", std::to_string(result.irLength)});
        table.addRow({"BYPASS", result.bypass});
    }
    table.write(out);
}

void writeLookupJson(std::ostream& out, const LookupResult& result)
{
    JsonWriter json(out);
    json.beginObject();
    json.key("idcode").string(idcodeHex(result.idcode));
    json.key("idcode_bits").string(idcodeBits(result.idcode));
    json.key("known").boolean(!result.name.empty());
    if (result.name.empty()) json.key("name").null();
    else json.key("name").string(result.name);
    json.key("ir_length").number(result.irLength);
    json.key("bypass").string(result.bypass);
    json.endObject();
    json.finish();
}

} // namespace jexjtag::cli
