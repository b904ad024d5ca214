// SPDX-License-Identifier: MIT
#pragma once
// BsdlEntity - what the reader takes from a BSDL entity.

#include <string>
#include <vector>

#include "bsdl/BsdlBoundaryRegister.hpp"
#include "bsdl/BsdlInstructionTable.hpp"
#include "bsdl/BsdlPinMap.hpp"
#include "bsdl/BsdlRegisterAccess.hpp"

namespace jexbsdl {

struct BsdlEntity {
    std::string name;                // the entity's name as written
    unsigned instructionLength = 0;  // INSTRUCTION_LENGTH
    std::string idcode;              // IDCODE_REGISTER, 32 characters of 0/1/X/x; "" when none
    BsdlInstructionTable instructions; // INSTRUCTION_OPCODE
    std::string instructionCapture;  // INSTRUCTION_CAPTURE as written (0/1/X); "" when none
    unsigned boundaryLength = 0;     // BOUNDARY_LENGTH; 0 when none
    BsdlBoundaryRegister boundary;   // BOUNDARY_REGISTER, one cell per number
    BsdlPinMap pins;                 // the port clause and the chosen PIN_MAP_STRING
    BsdlRegisterAccess registerAccess; // REGISTER_ACCESS
};

} // namespace jexbsdl
