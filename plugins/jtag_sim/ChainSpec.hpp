// SPDX-License-Identifier: MIT
#pragma once
// The text form of a simulated chain, as the "chain" open argument and
// option give it:
//
//   chain   := "" | device ("," device)*          device 0 first (nearest TDO)
//   device  := id ":" irlen (":" key "=" value)*
//            | "bsdl=" PATH                      a part made from a BSDL file
//   id      := hex IDCODE, with or without 0x ("0x4BA00477")
//            | "none" | "bypass"                 a device without IDCODE
//   irlen   := decimal, 2..64
//   key     := idcode | user | userbits | capture (case-insensitive)
//     idcode=OP    opcode of IDCODE                 default 1
//     user=OP      opcode of the scratch register   default 2
//     userbits=N   its length in bits, 1..64        default 32
//     capture=V    the Capture-IR value             default 1 (binary ...01)
//   Opcodes and values are 0x hex, 0b binary or decimal.
//
// Example: "0x4BA00477:4:idcode=0xE:user=0xA:userbits=35,none:5".
// Blanks around the parts are ignored.  IDCODEs must have bit 0 set and may
// not be 0xFFFFFFFF; opcodes must fit the IR, differ from each other and from
// BYPASS (all ones); the capture value must end in binary 01.

#include <string>
#include <vector>

#include "DeviceSpec.hpp"

namespace jexsim {

class ChainSpec {
public:
    static constexpr std::size_t kMaxDevices = 1024;

    // Parses `text`; false with `error` set (naming the entry) when it is bad.
    static bool parse(const std::string& text, std::vector<DeviceSpec>& devices, std::string& error);
    // The text form; options equal to their defaults are left out.
    static std::string format(const std::vector<DeviceSpec>& devices);
    // A device made from the BSDL file at path (SimPart); false with
    // `error` set when the file cannot be used.
    static bool fromBsdl(const std::string& path, DeviceSpec& device, std::string& error);
    // Checks one device; "" when it is sound, else the reason.
    static std::string check(const DeviceSpec& device);
    // Reads an unsigned number: 0x hex, 0b binary or decimal.
    static bool parseNumber(const std::string& text, uint64_t& value);
};

} // namespace jexsim
