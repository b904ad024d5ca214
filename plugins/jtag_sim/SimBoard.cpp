// SPDX-License-Identifier: MIT
#include "SimBoard.hpp"

#include "jexjtag/cable/PluginArgs.hpp"
#include "SimPart.hpp"

namespace jexsim {

using jexcable::PluginArgs;

namespace {

std::vector<std::string> splitOn(const std::string& text, char separator)
{
    std::vector<std::string> parts;
    std::size_t start = 0;
    for (;;) {
        const std::size_t pos = text.find(separator, start);
        const std::string part = PluginArgs::trim(text.substr(start, pos == std::string::npos ? pos : pos - start));
        if (!part.empty()) parts.push_back(part);
        if (pos == std::string::npos) return parts;
        start = pos + 1;
    }
}

bool parseRef(const std::string& text, const std::vector<DeviceSpec>& chain, SimBoard::PinRef& ref,
              std::string& error)
{
    const std::size_t colon = text.find(':');
    const std::string device = PluginArgs::trim(text.substr(0, colon));
    if (colon == std::string::npos || device.empty() || device.size() > 6 ||
        device.find_first_not_of("0123456789") != std::string::npos) {
        error = "\"" + text + "\" is not DEVICE:PIN";
        return false;
    }
    ref.device = std::stoul(device);
    ref.pin = PluginArgs::trim(text.substr(colon + 1));
    if (ref.device >= chain.size() || !chain[ref.device].part) {
        error = "\"" + text + "\": device " + device + " is not a part made from a BSDL file";
        return false;
    }
    if (SimBoard::resolve(ref, chain) < 0) {
        error = "\"" + text + "\": " + chain[ref.device].part->entity() + " has no pin " + ref.pin;
        return false;
    }
    return true;
}

} // namespace

int SimBoard::resolve(const PinRef& ref, const std::vector<DeviceSpec>& chain)
{
    if (ref.device >= chain.size() || !chain[ref.device].part) return -1;
    return chain[ref.device].part->findPin(ref.pin);
}

bool SimBoard::setLevels(const std::string& text, const std::vector<DeviceSpec>& chain, std::string& error)
{
    std::vector<Setting> updated = levels;
    if (PluginArgs::trim(text).empty()) updated.clear();
    for (const std::string& item : splitOn(text, ';')) {
        const std::size_t eq = item.rfind('=');
        const std::string level = eq == std::string::npos ? "" : PluginArgs::trim(item.substr(eq + 1));
        if (level != "0" && level != "1") {
            error = "\"" + item + "\" is not DEVICE:PIN=0 or DEVICE:PIN=1";
            return false;
        }
        Setting setting;
        setting.level = level == "1";
        if (!parseRef(item.substr(0, eq), chain, setting.pin, error)) return false;
        bool replaced = false;
        for (Setting& s : updated)
            if (s.pin.device == setting.pin.device &&
                resolve(s.pin, chain) == resolve(setting.pin, chain)) {
                s = setting;
                replaced = true;
            }
        if (!replaced) updated.push_back(setting);
    }
    levels = std::move(updated);
    ++version;
    return true;
}

bool SimBoard::setWires(const std::string& text, const std::vector<DeviceSpec>& chain, std::string& error)
{
    std::vector<Wire> updated;
    for (const std::string& item : splitOn(text, ';')) {
        const std::size_t dash = item.find('-');
        Wire wire;
        if (dash == std::string::npos) {
            error = "\"" + item + "\" is not DEVICE:PIN-DEVICE:PIN";
            return false;
        }
        if (!parseRef(item.substr(0, dash), chain, wire.a, error) ||
            !parseRef(item.substr(dash + 1), chain, wire.b, error))
            return false;
        updated.push_back(wire);
    }
    wires = std::move(updated);
    ++version;
    return true;
}

std::string SimBoard::formatLevels() const
{
    std::string text;
    for (const Setting& s : levels)
        text += (text.empty() ? "" : ";") + std::to_string(s.pin.device) + ":" + s.pin.pin + "=" + (s.level ? "1" : "0");
    return text;
}

std::string SimBoard::formatWires() const
{
    std::string text;
    for (const Wire& w : wires)
        text += (text.empty() ? "" : ";") + std::to_string(w.a.device) + ":" + w.a.pin + "-" +
                std::to_string(w.b.device) + ":" + w.b.pin;
    return text;
}

} // namespace jexsim
