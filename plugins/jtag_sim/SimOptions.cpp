// SPDX-License-Identifier: MIT
#include "SimOptions.hpp"

#include "ChainSpec.hpp"

namespace jexsim {

using jexcable::PluginArgs;

std::vector<DeviceSpec> SimOptions::defaultChain()
{
    DeviceSpec dap;
    dap.idcode = 0x4BA00477;
    dap.irLength = 4;
    dap.idcodeOpcode = 0xE;
    dap.userOpcode = 0xA; // DPACC
    dap.userBits = 35;

    DeviceSpec artix;
    artix.idcode = 0x0362D093;
    artix.irLength = 6;
    artix.idcodeOpcode = 0x09;
    artix.userOpcode = 0x02; // USER1

    DeviceSpec ecp5;
    ecp5.idcode = 0x41111043;
    ecp5.irLength = 8;
    ecp5.idcodeOpcode = 0xE0;
    ecp5.userOpcode = 0x32; // ER1

    return {dap, artix, ecp5};
}

bool SimOptions::parseFrequency(const std::string& text, uint64_t& hz)
{
    return PluginArgs::parseFrequency(text, kMaxFrequency, hz);
}

bool SimOptions::parseFlag(const std::string& text, bool& flag)
{
    return PluginArgs::parseFlag(text, flag);
}

bool SimOptions::set(const std::string& rawKey, const std::string& value, std::string& error)
{
    const std::string key = PluginArgs::toLower(PluginArgs::trim(rawKey));
    if (key == "chain") {
        std::vector<DeviceSpec> devices;
        if (!ChainSpec::parse(value, devices, error)) {
            error = "chain: " + error;
            return false;
        }
        chain = std::move(devices);
    } else if (key == "port") {
        const std::string p = PluginArgs::trim(value);
        if (p.empty()) {
            error = "port: empty port name";
            return false;
        }
        port = p;
    } else if (key == "frequency") {
        uint64_t hz = 0;
        if (!parseFrequency(value, hz)) {
            error = "frequency: \"" + value + "\" is not a frequency of 1 Hz to 1000M";
            return false;
        }
        frequencyHz = hz;
    } else if (key == "vcd") {
        vcdPath = PluginArgs::trim(value);
    } else if (key == "new_firmware") {
        bool flag = false;
        if (!parseFlag(value, flag)) {
            error = "new_firmware: \"" + value + "\" is not 0 or 1";
            return false;
        }
        newFirmware = flag;
    } else if (key == "pins") {
        if (!board.setLevels(value, chain, error)) {
            error = "pins: " + error;
            return false;
        }
    } else if (key == "wire") {
        if (!board.setWires(value, chain, error)) {
            error = "wire: " + error;
            return false;
        }
    } else {
        error = "unknown option \"" + rawKey + "\" (chain, port, frequency, vcd, new_firmware, pins, wire)";
        return false;
    }
    return true;
}

bool SimOptions::get(const std::string& rawKey, std::string& value) const
{
    const std::string key = PluginArgs::toLower(PluginArgs::trim(rawKey));
    if (key == "chain") value = ChainSpec::format(chain);
    else if (key == "port") value = port;
    else if (key == "frequency") value = std::to_string(frequencyHz);
    else if (key == "vcd") value = vcdPath;
    else if (key == "new_firmware") value = newFirmware ? "1" : "0";
    else if (key == "pins") value = board.formatLevels();
    else if (key == "wire") value = board.formatWires();
    else return false;
    return true;
}

bool SimOptions::apply(const PluginArgs& args, std::string& error, std::vector<std::string>* ignored)
{
    static const char* const known[] = {"chain", "port", "frequency", "vcd", "new_firmware", "pins", "wire"};
    SimOptions updated = *this;
    // Pins and wires name devices of the chain: they go after it.
    for (const bool boardPass : {false, true}) {
        for (const auto& [key, value] : args.entries()) {
            bool isKnown = false;
            for (const char* k : known) isKnown = isKnown || PluginArgs::equalsIgnoreCase(key, k);
            if (!isKnown) {
                if (ignored && !boardPass) ignored->push_back(key);
                continue;
            }
            const bool boardKey = PluginArgs::equalsIgnoreCase(key, "pins") || PluginArgs::equalsIgnoreCase(key, "wire");
            if (boardKey == boardPass && !updated.set(key, value, error)) return false;
        }
    }
    *this = std::move(updated);
    return true;
}

} // namespace jexsim
