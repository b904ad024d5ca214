// SPDX-License-Identifier: MIT
#include "bsdl/BsdlInstructionTable.hpp"

#include "bsdl/BsdlText.hpp"

namespace jexbsdl {

namespace {

bool isSpace(char c) { return c == ' ' || c == '\t' || c == '\r' || c == '\n' || c == '\v' || c == '\f'; }

bool isOpcodeBit(char c) { return c == '0' || c == '1' || c == 'X' || c == 'x'; }

} // namespace

void BsdlInstructionTable::parse(const BsdlStringValue& value, BsdlDiagnostics& diagnostics)
{
    const std::string& text = value.text();
    const size_t n = text.size();
    size_t pos = 0;
    auto skipSpace = [&] {
        while (pos < n && isSpace(text[pos])) ++pos;
    };
    auto rest = [&] { return quoted(std::string_view(text).substr(pos, 20)); };
    auto fail = [&](const std::string& what) { diagnostics.error(value.lineAt(pos), "INSTRUCTION_OPCODE: " + what); };

    skipSpace();
    if (pos == n) fail("no instruction is declared");
    for (;;) {
        skipSpace();
        if (pos == n || !isLetter(text[pos])) fail("instruction name expected at " + (pos == n ? "the end" : rest()));
        const size_t nameStart = pos;
        while (pos < n && isIdentifierChar(text[pos])) ++pos;
        std::string name = text.substr(nameStart, pos - nameStart);
        const unsigned line = value.lineAt(nameStart);

        skipSpace();
        if (pos == n || text[pos] != '(') fail("'(' expected after instruction " + name);
        ++pos;
        std::vector<std::string> opcodes;
        for (;;) {
            skipSpace();
            const size_t start = pos;
            while (pos < n && isOpcodeBit(text[pos])) ++pos;
            if (pos == start || (pos < n && isIdentifierChar(text[pos])))
                fail("opcode of " + name + " must be made of 0, 1 and X, found " +
                     (start == n ? std::string("the end") : quoted(std::string_view(text).substr(start, 20))));
            opcodes.push_back(text.substr(start, pos - start));
            skipSpace();
            if (pos < n && text[pos] == ',') {
                ++pos;
                continue;
            }
            if (pos < n && text[pos] == ')') {
                ++pos;
                break;
            }
            fail("',' or ')' expected in the opcodes of " + name + (pos == n ? " at the end" : ", found " + rest()));
        }

        const std::string key = upperCase(name);
        auto found = m_index.find(key);
        if (found == m_index.end()) {
            m_index.emplace(key, m_instructions.size());
            m_instructions.push_back(Instruction {std::move(name), std::move(opcodes), line});
        } else {
            Instruction& first = m_instructions[found->second];
            diagnostics.warning(line, "instruction " + name + " is declared again; its opcodes are added to the "
                                      "declaration on line " + std::to_string(first.line));
            first.opcodes.insert(first.opcodes.end(), opcodes.begin(), opcodes.end());
        }

        skipSpace();
        if (pos == n) return;
        if (text[pos] != ',') fail("',' expected between instructions, found " + rest());
        ++pos;
        skipSpace();
        if (pos == n) {
            diagnostics.warning(value.lineAt(n), "INSTRUCTION_OPCODE ends with a ','");
            return;
        }
    }
}

void BsdlInstructionTable::checkLengths(unsigned irLength, BsdlDiagnostics& diagnostics) const
{
    for (const Instruction& instruction : m_instructions) {
        for (const std::string& opcode : instruction.opcodes) {
            if (opcode.size() != irLength) {
                diagnostics.warning(instruction.line, "opcode " + opcode + " of " + instruction.name + " has " +
                                                          std::to_string(opcode.size()) +
                                                          " bits, but INSTRUCTION_LENGTH is " +
                                                          std::to_string(irLength));
                break;
            }
        }
    }
}

const BsdlInstructionTable::Instruction* BsdlInstructionTable::find(std::string_view name) const
{
    auto it = m_index.find(upperCase(name));
    return it == m_index.end() ? nullptr : &m_instructions[it->second];
}

} // namespace jexbsdl
