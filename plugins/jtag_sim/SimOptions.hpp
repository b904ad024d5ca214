// SPDX-License-Identifier: MIT
#pragma once
// The settings of a simulated cable and how the open arguments set them.
//
// Open arguments (key=value, keys in any case; the last of a key counts):
//   chain=TEXT        the simulated chain (ChainSpec syntax; empty: no device)
//   port=NAME         the cable's port, which names its lock   (default sim0)
//   frequency=F       TCK frequency in Hz; suffix k or M allowed (default 10M)
//   vcd=PATH          record a VCD waveform of everything driven
//   new_firmware=B    1/true/yes/on: report new firmware (target_flags bit 0)
//   pins=TEXT         levels the board holds pins of BSDL parts at (SimBoard);
//                     each set changes the pins it names, "" clears them all
//   wire=TEXT         wires between pins of BSDL parts (SimBoard), replacing
//                     the wires before; "" removes them
// Arguments with other keys (such as "type=jtag_sim", which the library
// appends) are ignored.

#include <cstdint>
#include <string>
#include <vector>

#include "DeviceSpec.hpp"
#include "SimBoard.hpp"
#include "jexjtag/cable/PluginArgs.hpp"

namespace jexsim {

class SimOptions {
public:
    static constexpr uint64_t kDefaultFrequency = 10000000;
    static constexpr uint64_t kMaxFrequency = 1000000000;

    std::vector<DeviceSpec> chain = defaultChain();
    std::string port = "sim0";
    uint64_t frequencyHz = kDefaultFrequency;
    std::string vcdPath;
    bool newFirmware = false;
    SimBoard board;

    // Three real devices, device 0 first:
    //   0x4BA00477 ARM Cortex-M debug port (JTAG-DP), IR 4
    //   0x0362D093 Xilinx XC7A35T, IR 6
    //   0x41111043 Lattice ECP5 LFE5U-25F, IR 8
    // with their IDCODE opcodes; the scratch register sits at the opcode of
    // the device's data-access or user register.
    static std::vector<DeviceSpec> defaultChain();

    // Applies the arguments; false with `error` set when a value is bad (the
    // options are then unchanged).  `ignored` receives unknown keys.
    bool apply(const jexcable::PluginArgs& args, std::string& error, std::vector<std::string>* ignored = nullptr);

    // One option by key (as above); false with `error` set for an unknown key
    // or a bad value.  Does not touch the options on failure.
    bool set(const std::string& key, const std::string& value, std::string& error);
    // The value of an option as text; false for an unknown key.  The keys
    // are those of set(); frequency is decimal Hz, new_firmware "0" or "1".
    bool get(const std::string& key, std::string& value) const;

    static bool parseFrequency(const std::string& text, uint64_t& hz);
    static bool parseFlag(const std::string& text, bool& flag);
};

} // namespace jexsim
