// SPDX-License-Identifier: MIT
#include "PinsOutput.hpp"

#include "JsonWriter.hpp"
#include "TextTable.hpp"

namespace jexjtag::cli {

namespace {

std::string levelText(int level) { return level < 0 ? "-" : std::to_string(level); }

} // namespace

void writePinsText(std::ostream& out, const PinsResult& result)
{
    out << "device " << result.device << " (" << result.entity << "), " << result.instruction << ": "
        << result.pins.size() << (result.pins.size() == 1 ? " pin\n" : " pins\n");
    TextTable table({false, false, false, true, true});
    table.addRow({"PORT", "PIN", "FUNCTION", "CELL", "LEVEL"});
    for (const PinRow& pin : result.pins)
        table.addRow({pin.port, pin.pin.empty() ? "-" : pin.pin, pin.function, std::to_string(pin.cell),
                      levelText(pin.level)});
    table.write(out, "  ");
}

void writePinsJson(std::ostream& out, const PinsResult& result)
{
    JsonWriter json(out);
    json.beginObject();
    json.key("device").number(result.device);
    json.key("pins").beginArray();
    for (const PinRow& pin : result.pins) {
        json.beginObject();
        json.key("port").string(pin.port);
        json.key("pin").string(pin.pin);
        json.key("function").string(pin.function);
        json.key("cell").number(static_cast<uint64_t>(pin.cell));
        if (pin.level < 0) json.key("level").null();
        else json.key("level").number(static_cast<uint64_t>(pin.level));
        json.endObject();
    }
    json.endArray();
    json.endObject();
    json.finish();
}

void writePinChanges(std::ostream& out, const PinsResult& before, const PinsResult& after)
{
    for (size_t i = 0; i < after.pins.size() && i < before.pins.size(); ++i) {
        const PinRow& pin = after.pins[i];
        if (pin.level == before.pins[i].level) continue;
        out << pin.port;
        if (!pin.pin.empty()) out << " (pin " << pin.pin << ")";
        out << ": " << levelText(before.pins[i].level) << " -> " << levelText(pin.level) << '\n';
    }
    out.flush();
}

} // namespace jexjtag::cli
