#pragma once
// PinAccess - SAMPLE, EXTEST, HIGHZ and CLAMP on one device of a target's
// chain, described by a BsdlPart.  The device's IR length is set to the
// part's first; device shifts leave the other devices in BYPASS.  Failures
// come back as a reason text (empty on success).

#include <cstdint>
#include <string>
#include <vector>

#include "boundary/BsdlPart.hpp"

namespace JexRT {

class Target;

class PinAccess {
public:
    PinAccess(Target& target, unsigned handle, unsigned deviceIndex, const BsdlPart& part);

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
    std::string loadInstruction(const char* name, const char* alternative = nullptr);
    std::string shiftRegister(const std::vector<uint8_t>& in, std::vector<uint8_t>& out);
    void decode(const std::vector<uint8_t>& cells, std::vector<int8_t>& levels) const;

    Target& m_target;
    unsigned m_handle;
    unsigned m_device;
    const BsdlPart& m_part;
};

} // namespace JexRT
