#pragma once
// BsdlEntity - what the reader takes from a BSDL entity.

#include <string>

#include "bsdl/BsdlInstructionTable.hpp"

namespace jexbsdl {

struct BsdlEntity {
    std::string name;                // the entity's name as written
    unsigned instructionLength = 0;  // INSTRUCTION_LENGTH
    std::string idcode;              // IDCODE_REGISTER, 32 characters of 0/1/X/x; "" when none
    BsdlInstructionTable instructions; // INSTRUCTION_OPCODE
};

} // namespace jexbsdl
