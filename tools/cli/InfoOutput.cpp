// SPDX-License-Identifier: MIT
#include "InfoOutput.hpp"

#include <cstdio>
#include <cstring>

#include "JsonWriter.hpp"
#include "TextTable.hpp"

namespace jexjtag::cli {

namespace {

std::string fieldText(const char (&field)[JEXJTAG_INFO_TEXT_SIZE])
{
    const void* end = std::memchr(field, '\0', sizeof field);
    const size_t length = end ? static_cast<size_t>(static_cast<const char*>(end) - field) : sizeof field;
    return std::string(field, length);
}

std::string hex(unsigned value)
{
    char text[16];
    std::snprintf(text, sizeof text, "0x%X", value);
    return text;
}

std::string flagsText(uint32_t flags)
{
    std::string text = hex(flags);
    if (flags & JEXJTAG_FLAG_NEW_FIRMWARE) text += " (new firmware available)";
    return text;
}

} // namespace

std::vector<std::pair<std::string, std::string>> infoFields(const JexJtagTargetInfo& info)
{
    return {{"target_name", fieldText(info.target_name)}, {"plugin_name", fieldText(info.plugin_name)},
            {"fw_ver", fieldText(info.fw_ver)},           {"driver_ver", fieldText(info.driver_ver)},
            {"plugin_ver", fieldText(info.plugin_ver)},   {"vendor", fieldText(info.vendor)},
            {"frequency", fieldText(info.frequency)},     {"port", fieldText(info.port)},
            {"full_name", fieldText(info.full_name)},     {"target_uid", fieldText(info.target_uid)},
            {"rawinfo", fieldText(info.rawinfo)}};
}

void writeInfoText(std::ostream& out, const InfoResult& result)
{
    TextTable table;
    table.addRow({"api_version", hex(result.apiVersion) + " (" + result.apiVersionText + ")"});
    table.addRow({"target_type", result.targetType});
    for (const auto& field : result.fields) table.addRow({field.first, field.second});
    table.addRow({"target_flags", flagsText(result.targetFlags)});
    table.write(out);
}

void writeInfoJson(std::ostream& out, const InfoResult& result)
{
    JsonWriter json(out);
    json.beginObject();
    json.key("api_version").number(result.apiVersion);
    json.key("api_version_text").string(result.apiVersionText);
    json.key("target_type").string(result.targetType);
    json.key("target").beginObject();
    for (const auto& field : result.fields) json.key(field.first).string(field.second);
    json.key("target_flags").number(result.targetFlags);
    json.key("new_firmware").boolean((result.targetFlags & JEXJTAG_FLAG_NEW_FIRMWARE) != 0);
    json.endObject();
    json.endObject();
    json.finish();
}

} // namespace jexjtag::cli
