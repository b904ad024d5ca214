// SPDX-License-Identifier: MIT
#pragma once
// The make-up of one simulated TAP: what the hardware is, not what a driver
// believes about it.

#include <cstdint>
#include <memory>
#include <string>

namespace jexsim {

class SimPart;

struct DeviceSpec {
    static constexpr uint32_t kMinIrLength = 2;  // IEEE 1149.1: the capture needs two bits
    static constexpr uint32_t kMaxIrLength = 64;
    static constexpr uint32_t kMaxUserBits = 64;

    bool hasIdcode = true;
    uint32_t idcode = 0;         // bit 0 set, as IEEE 1149.1 requires
    uint32_t irLength = 0;       // 2..64
    uint64_t idcodeOpcode = 1;   // selects IDCODE (ignored without IDCODE)
    uint64_t userOpcode = 2;     // selects the scratch user register
    uint32_t userBits = 32;      // length of the user register, 1..64
    uint64_t irCapture = 1;      // value loaded in Capture-IR; low bits binary 01
    // A device made from a BSDL file: its instructions and boundary register
    // (the fields above then come from the file; the user register is absent).
    std::shared_ptr<const SimPart> part;

    uint64_t bypassOpcode() const { return irLength >= 64 ? ~uint64_t{0} : (uint64_t{1} << irLength) - 1; }
};

} // namespace jexsim
