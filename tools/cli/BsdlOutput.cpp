// SPDX-License-Identifier: MIT
#include "BsdlOutput.hpp"

#include "Idcode.hpp"
#include "JsonWriter.hpp"
#include "TextTable.hpp"

namespace jexjtag::cli {

namespace {

// The IDCODE register in hex when it has 32 plain bits.
std::string idcodeHexOf(const std::string& idcode)
{
    if (idcode.size() != 32) return "";
    const auto value = idcodeFromBits(idcode);
    return value ? idcodeHex(*value) : "";
}

} // namespace

void writeBsdlText(std::ostream& out, const BsdlResult& result)
{
    std::string idcode = result.idcode.empty() ? "(none)" : result.idcode;
    const std::string hex = idcodeHexOf(result.idcode);
    if (!hex.empty()) idcode += " (" + hex + ")";
    TextTable table;
    table.addRow({"File", result.file});
    table.addRow({"Entity", result.entity});
    table.addRow({"IR length", std::to_string(result.irLength)});
    table.addRow({"IDCODE", idcode});
    table.addRow({"BYPASS", result.bypass.empty() ? "(none)" : result.bypass});
    table.write(out);
}

void writeBsdlJson(std::ostream& out, const BsdlResult& result)
{
    JsonWriter json(out);
    json.beginObject();
    json.key("file").string(result.file);
    json.key("entity").string(result.entity);
    json.key("ir_length").number(result.irLength);
    if (result.idcode.empty()) json.key("idcode").null();
    else json.key("idcode").string(result.idcode);
    const std::string hex = idcodeHexOf(result.idcode);
    if (hex.empty()) json.key("idcode_hex").null();
    else json.key("idcode_hex").string(hex);
    if (result.bypass.empty()) json.key("bypass").null();
    else json.key("bypass").string(result.bypass);
    json.endObject();
    json.finish();
}

} // namespace jexjtag::cli
