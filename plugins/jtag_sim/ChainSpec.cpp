// SPDX-License-Identifier: MIT
#include "ChainSpec.hpp"

#include <cctype>
#include <cstdio>

#include "jexjtag/cable/PluginArgs.hpp"
#include "SimPart.hpp"

namespace jexsim {

using jexcable::PluginArgs;

namespace {

std::vector<std::string> split(const std::string& text, char separator)
{
    std::vector<std::string> parts;
    std::size_t start = 0;
    for (;;) {
        const std::size_t pos = text.find(separator, start);
        parts.push_back(PluginArgs::trim(text.substr(start, pos == std::string::npos ? std::string::npos : pos - start)));
        if (pos == std::string::npos) break;
        start = pos + 1;
    }
    return parts;
}

bool parseDigits(const std::string& digits, unsigned base, uint64_t& value)
{
    if (digits.empty()) return false;
    uint64_t v = 0;
    for (const char c : digits) {
        unsigned d;
        if (c >= '0' && c <= '9') d = static_cast<unsigned>(c - '0');
        else if (c >= 'a' && c <= 'f') d = static_cast<unsigned>(c - 'a' + 10);
        else if (c >= 'A' && c <= 'F') d = static_cast<unsigned>(c - 'A' + 10);
        else return false;
        if (d >= base) return false;
        if (v > (~uint64_t{0} - d) / base) return false;
        v = v * base + d;
    }
    value = v;
    return true;
}

std::string hex(uint64_t value)
{
    char text[24];
    std::snprintf(text, sizeof text, "0x%llX", static_cast<unsigned long long>(value));
    return text;
}

} // namespace

bool ChainSpec::parseNumber(const std::string& text, uint64_t& value)
{
    if (text.size() > 2 && text[0] == '0' && (text[1] == 'x' || text[1] == 'X'))
        return parseDigits(text.substr(2), 16, value);
    if (text.size() > 2 && text[0] == '0' && (text[1] == 'b' || text[1] == 'B'))
        return parseDigits(text.substr(2), 2, value);
    return parseDigits(text, 10, value);
}

bool ChainSpec::fromBsdl(const std::string& path, DeviceSpec& d, std::string& error)
{
    std::shared_ptr<const SimPart> part = SimPart::load(path, error);
    if (!part) return false;
    d.part = part;
    d.hasIdcode = part->hasIdcode();
    d.idcode = part->idcode();
    d.irLength = part->irLength();
    d.idcodeOpcode = part->idcodeOpcode();
    d.userOpcode = ~uint64_t{0}; // no user register
    d.irCapture = part->irCapture();
    return true;
}

std::string ChainSpec::check(const DeviceSpec& d)
{
    if (d.irLength < DeviceSpec::kMinIrLength || d.irLength > DeviceSpec::kMaxIrLength)
        return "IR length " + std::to_string(d.irLength) + " is outside 2..64";
    if (d.hasIdcode && (d.idcode & 1u) == 0) return "IDCODE " + hex(d.idcode) + " has bit 0 clear";
    if (d.hasIdcode && d.idcode == 0xFFFFFFFFu) return "IDCODE 0xFFFFFFFF is not a valid IDCODE";
    const uint64_t bypass = d.bypassOpcode();
    if (d.idcodeOpcode > bypass || d.userOpcode > bypass || d.irCapture > bypass)
        return "an opcode or the capture value does not fit an IR of " + std::to_string(d.irLength) + " bits";
    if (d.hasIdcode && d.idcodeOpcode == bypass) return "the IDCODE opcode is the BYPASS opcode (all ones)";
    if (d.userOpcode == bypass) return "the user opcode is the BYPASS opcode (all ones)";
    if (d.hasIdcode && d.userOpcode == d.idcodeOpcode) return "the user and IDCODE opcodes are the same";
    if ((d.irCapture & 3u) != 1u) return "the capture value " + hex(d.irCapture) + " does not end in binary 01";
    if (d.userBits < 1 || d.userBits > DeviceSpec::kMaxUserBits)
        return "userbits " + std::to_string(d.userBits) + " is outside 1..64";
    return {};
}

bool ChainSpec::parse(const std::string& text, std::vector<DeviceSpec>& devices, std::string& error)
{
    std::vector<DeviceSpec> result;
    if (PluginArgs::trim(text).empty()) {
        devices.clear();
        return true;
    }
    const std::vector<std::string> entries = split(text, ',');
    if (entries.size() > kMaxDevices) {
        error = "more than " + std::to_string(kMaxDevices) + " devices";
        return false;
    }
    for (std::size_t i = 0; i < entries.size(); ++i) {
        const std::string where = "device " + std::to_string(i) + " (\"" + entries[i] + "\"): ";
        if (PluginArgs::toLower(entries[i]).rfind("bsdl=", 0) == 0) {
            DeviceSpec d;
            if (!fromBsdl(PluginArgs::trim(entries[i].substr(5)), d, error)) {
                error = where + error;
                return false;
            }
            result.push_back(d);
            continue;
        }
        const std::vector<std::string> fields = split(entries[i], ':');
        if (fields.size() < 2) {
            error = where + "expected IDCODE:IRLENGTH";
            return false;
        }
        DeviceSpec d;
        const std::string id = PluginArgs::toLower(fields[0]);
        uint64_t value = 0;
        if (id == "none" || id == "bypass") {
            d.hasIdcode = false;
        } else {
            const std::string digits = id.rfind("0x", 0) == 0 ? id.substr(2) : id;
            if (digits.size() > 8 || !parseDigits(digits, 16, value)) {
                error = where + "\"" + fields[0] + "\" is not a hexadecimal IDCODE, \"none\" or \"bypass\"";
                return false;
            }
            d.idcode = static_cast<uint32_t>(value);
        }
        if (!parseDigits(fields[1], 10, value) || value > 0xFFFFu) {
            error = where + "\"" + fields[1] + "\" is not an IR length";
            return false;
        }
        d.irLength = static_cast<uint32_t>(value);
        for (std::size_t f = 2; f < fields.size(); ++f) {
            const std::size_t eq = fields[f].find('=');
            const std::string key = PluginArgs::toLower(PluginArgs::trim(fields[f].substr(0, eq)));
            const std::string val = eq == std::string::npos ? std::string() : PluginArgs::trim(fields[f].substr(eq + 1));
            if (eq == std::string::npos || !parseNumber(val, value)) {
                error = where + "\"" + fields[f] + "\" is not key=number";
                return false;
            }
            if (key == "idcode") d.idcodeOpcode = value;
            else if (key == "user") d.userOpcode = value;
            else if (key == "capture") d.irCapture = value;
            else if (key == "userbits") d.userBits = value > 0xFFFFu ? 0xFFFFu : static_cast<uint32_t>(value);
            else {
                error = where + "unknown key \"" + key + "\" (idcode, user, userbits, capture)";
                return false;
            }
        }
        const std::string problem = check(d);
        if (!problem.empty()) {
            error = where + problem;
            return false;
        }
        result.push_back(d);
    }
    devices = std::move(result);
    return true;
}

std::string ChainSpec::format(const std::vector<DeviceSpec>& devices)
{
    const DeviceSpec defaults;
    std::string text;
    for (const DeviceSpec& d : devices) {
        if (!text.empty()) text += ',';
        if (d.part) {
            text += "bsdl=" + d.part->path();
            continue;
        }
        if (d.hasIdcode) {
            char id[16];
            std::snprintf(id, sizeof id, "0x%08X", d.idcode);
            text += id;
        } else {
            text += "none";
        }
        text += ':' + std::to_string(d.irLength);
        if (d.hasIdcode && d.idcodeOpcode != defaults.idcodeOpcode) text += ":idcode=" + hex(d.idcodeOpcode);
        if (d.userOpcode != defaults.userOpcode) text += ":user=" + hex(d.userOpcode);
        if (d.userBits != defaults.userBits) text += ":userbits=" + std::to_string(d.userBits);
        if (d.irCapture != defaults.irCapture) text += ":capture=" + hex(d.irCapture);
    }
    return text;
}

} // namespace jexsim
