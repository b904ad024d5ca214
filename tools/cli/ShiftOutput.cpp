// SPDX-License-Identifier: MIT
#include "ShiftOutput.hpp"

#include "JsonWriter.hpp"
#include "TapStateName.hpp"

namespace jexjtag::cli {

void writeShiftText(std::ostream& out, const ShiftResult& result)
{
    out << formatData(result.tdo, result.notation) << '\n';
}

void writeShiftJson(std::ostream& out, const ShiftResult& result)
{
    JsonWriter json(out);
    json.beginObject();
    json.key("register").string(result.reg);
    if (result.device) json.key("device").number(*result.device);
    else json.key("device").null();
    json.key("bits").number(result.tdo.size());
    json.key("exit_state").string(tapStateName(result.exitState));
    if (result.tdi) json.key("tdi").string(formatData(*result.tdi, result.notation));
    else json.key("tdi").null();
    json.key("tdo").string(formatData(result.tdo, result.notation));
    json.key("tdo_bits").string(result.tdo.toBinary());
    if (result.instruction) {
        json.key("instruction").beginObject();
        json.key("bits").number(result.instruction->tdi.size());
        json.key("tdi").string(formatData(result.instruction->tdi, result.instruction->notation));
        json.key("tdo").string(formatData(result.instruction->tdo, result.instruction->notation));
        json.endObject();
    } else {
        json.key("instruction").null();
    }
    json.endObject();
    json.finish();
}

} // namespace jexjtag::cli
