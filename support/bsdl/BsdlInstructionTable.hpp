// SPDX-License-Identifier: MIT
#pragma once
// BsdlInstructionTable - the instructions of an INSTRUCTION_OPCODE attribute:
// each name with its opcodes in the order declared, for example
// "BYPASS (11111, 01111), IDCODE (00010)".  Names are looked up ignoring case.

#include <cstddef>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "bsdl/BsdlDiagnostics.hpp"
#include "bsdl/BsdlStringValue.hpp"

namespace jexbsdl {

class BsdlInstructionTable {
public:
    struct Instruction {
        std::string name;                 // as written
        std::vector<std::string> opcodes; // in declaration order, never empty
        unsigned line = 0;
    };

    // Parses the attribute's text; throws (through diagnostics) when it does
    // not follow the opcode-description syntax, warns about oddities such as
    // a repeated name (whose opcodes are added to the first declaration).
    void parse(const BsdlStringValue& value, BsdlDiagnostics& diagnostics);
    // Warns about every instruction with an opcode whose length is not
    // irLength.
    void checkLengths(unsigned irLength, BsdlDiagnostics& diagnostics) const;

    // The instruction of that name (any case), or null.
    const Instruction* find(std::string_view name) const;
    const std::vector<Instruction>& instructions() const { return m_instructions; }
    bool empty() const { return m_instructions.empty(); }

private:
    std::vector<Instruction> m_instructions;
    std::unordered_map<std::string, size_t> m_index; // upper-case name -> position
};

} // namespace jexbsdl
