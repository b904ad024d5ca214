// SPDX-License-Identifier: MIT
#pragma once
// PinAccess - SAMPLE, EXTEST, HIGHZ and CLAMP on one device of a target's
// chain, described by a BsdlPart.  The device's IR length is set to the
// part's first.  The other devices are put in BYPASS, except those this
// session left in EXTEST, HIGHZ or CLAMP (the held devices): their
// instruction is loaded again with every IR scan and, under EXTEST, their
// boundary register is refilled with the values it drives, so pins driven on
// one part can be sampled on another.  Failures come back as a reason text
// (empty on success).

#include <cstdint>
#include <map>
#include <string>
#include <vector>

#include "boundary/BsdlPart.hpp"

namespace JexRT {

class Target;

class PinAccess {
public:
    // A device held in EXTEST, HIGHZ or CLAMP: its opcode (bit 0 first) and,
    // under EXTEST, the boundary register it keeps (cell 0 first).
    struct Held {
        std::vector<uint8_t> instruction;
        std::vector<uint8_t> boundary; // empty: BYPASS register selected
    };
    using HeldDevices = std::map<unsigned, Held>;

    PinAccess(Target& target, unsigned handle, unsigned deviceIndex, const BsdlPart& part, HeldDevices& held);

    // Levels per pin of the part (0, 1, -1 without capturing cell), and the
    // captured register (cell 0 first, one byte per cell).
    std::string sample(std::vector<int8_t>& levels, std::vector<uint8_t>& cells);
    // Drives pins (indexes into part.pins()) to '0', '1' or 'z'; levels as
    // for sample, read under EXTEST.
    std::string extest(const std::vector<std::pair<size_t, char>>& settings, std::vector<int8_t>& levels);
    std::string highz();
    std::string clamp();

private:
    std::string prepare();
    std::vector<uint8_t> opcodeBits(const char* name, const char* alternative) const;
    std::string loadInstruction(const char* name, const char* alternative = nullptr);
    std::string shiftRegister(const std::vector<uint8_t>& in, std::vector<uint8_t>& out);
    // Remembers the device as held with the instruction loaded last.
    void hold(std::vector<uint8_t> boundary);
    void decode(const std::vector<uint8_t>& cells, std::vector<int8_t>& levels) const;

    Target& m_target;
    unsigned m_handle;
    unsigned m_device;
    const BsdlPart& m_part;
    HeldDevices& m_held;
    unsigned m_count = 0;       // devices in the chain
    std::vector<uint8_t> m_ir;  // the instruction loaded last
};

} // namespace JexRT
