// SPDX-License-Identifier: MIT
#include "ScanOutput.hpp"

#include "Idcode.hpp"
#include "JsonWriter.hpp"
#include "TextTable.hpp"

namespace jexjtag::cli {

namespace {

// 0x... when the library's text is a plain 32-bit number, the text itself otherwise.
std::string displayIdcode(const std::string& bits)
{
    const auto value = idcodeFromBits(bits);
    return value ? idcodeHex(*value) : bits;
}

// The name, and where a length that is not the device list's comes from.
std::string deviceText(const ChainDevice& device)
{
    if (device.irLengthSource == "bsdl") return device.name + "  (BSDL " + device.bsdlFile + ")";
    if (device.name.empty())
        return device.irLengthSource == "capture" ? "(unknown; IR length inferred from the IR capture)" : "(unknown)";
    return device.name;
}

} // namespace

namespace {

// A plug-in answers an IR length as an int: a negative one is no length.
bool irLengthKnown(unsigned irLength) { return static_cast<int>(irLength) >= 0; }

} // namespace

void writeScanText(std::ostream& out, const ScanResult& result)
{
    const size_t count = result.devices.size();
    if (count == 0) {
        out << result.target << ": no devices found\n";
        return;
    }
    out << result.target << ": " << count << (count == 1 ? " device" : " devices") << " (device 0 is nearest TDO)\n";
    TextTable table({true, false, true, false});
    table.addRow({"#", "IDCODE", "IR", "DEVICE"});
    for (const ChainDevice& device : result.devices)
        table.addRow({std::to_string(device.index), displayIdcode(device.idcodeBits),
                      irLengthKnown(device.irLength) ? std::to_string(device.irLength) : "unknown",
                      deviceText(device)});
    table.write(out, "  ");
}

void writeScanJson(std::ostream& out, const ScanResult& result)
{
    JsonWriter json(out);
    json.beginObject();
    json.key("target").string(result.target);
    json.key("count").number(result.devices.size());
    json.key("devices").beginArray();
    for (const ChainDevice& device : result.devices) {
        json.beginObject();
        json.key("index").number(device.index);
        const auto value = idcodeFromBits(device.idcodeBits);
        if (value) json.key("idcode").string(idcodeHex(*value));
        else json.key("idcode").null();
        json.key("idcode_bits").string(device.idcodeBits);
        if (irLengthKnown(device.irLength)) json.key("ir_length").number(device.irLength);
        else json.key("ir_length").null();
        if (device.name.empty()) json.key("name").null();
        else json.key("name").string(device.name);
        json.key("known").boolean(!device.name.empty());
        json.key("ir_length_source").string(device.irLengthSource);
        if (device.irLengthSource == "bsdl") json.key("bsdl_file").string(device.bsdlFile);
        json.endObject();
    }
    json.endArray();
    json.endObject();
    json.finish();
}

} // namespace jexjtag::cli
