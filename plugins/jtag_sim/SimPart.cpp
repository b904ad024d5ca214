// SPDX-License-Identifier: MIT
#include "SimPart.hpp"

#include <memory>

#include "bsdl/BsdlReader.hpp"
#include "bsdl/BsdlText.hpp"
#include "hostlayer/PortException.hpp"

namespace jexsim {

namespace {

using Register = jexbsdl::BsdlBoundaryRegister;

struct ReaderRelease {
    void operator()(BsdlReader* reader) const { reader->removeReader(); }
};

std::string narrow(const std::wstring& text)
{
    std::string out;
    for (wchar_t c : text)
        if (c != L'\n') out += (c > 0 && c < 0x80) ? static_cast<char>(c) : '?';
    return out;
}

// Bits of a 0/1/X text, most significant first; X reads 0 and is left out
// of the mask.
void bitsOf(const std::string& text, uint64_t& value, uint64_t& mask)
{
    value = 0;
    mask = 0;
    for (char c : text) {
        value <<= 1;
        mask <<= 1;
        if (c == '1') value |= 1u;
        if (c == '0' || c == '1') mask |= 1u;
    }
}

SimPart::Instruction instructionOf(const std::string& name)
{
    const std::string n = jexbsdl::upperCase(name);
    if (n == "IDCODE") return SimPart::Instruction::Idcode;
    if (n == "SAMPLE" || n == "PRELOAD" || n == "SAMPLE_PRELOAD") return SimPart::Instruction::Sample;
    if (n == "EXTEST") return SimPart::Instruction::Extest;
    if (n == "HIGHZ") return SimPart::Instruction::Highz;
    if (n == "CLAMP") return SimPart::Instruction::Clamp;
    return SimPart::Instruction::Bypass;
}

} // namespace

std::shared_ptr<const SimPart> SimPart::load(const std::string& path, std::string& error)
{
    std::unique_ptr<BsdlReader, ReaderRelease> reader;
    try {
        reader.reset(BsdlReader::CreateBsdlReader(path.c_str()));
    } catch (const Port::Exception& e) {
        error = narrow(e.getMessage());
        return nullptr;
    }
    if (!reader) {
        error = "BSDL file '" + path + "' cannot be read or is not BSDL";
        return nullptr;
    }
    const jexbsdl::BsdlEntity& e = reader->entity();
    if (e.instructionLength < 2 || e.instructionLength > 64) {
        error = "BSDL file '" + path + "': the simulation takes IR lengths of 2 to 64 bits, not " +
                std::to_string(e.instructionLength);
        return nullptr;
    }
    auto part = std::make_shared<SimPart>();
    part->m_path = path;
    part->m_entity = e.name;
    part->m_irLength = e.instructionLength;
    uint64_t mask = 0;
    if (e.idcode.size() == 32) {
        uint64_t value = 0;
        bitsOf(e.idcode, value, mask);
        part->m_hasIdcode = true;
        part->m_idcode = static_cast<uint32_t>(value) | 1u;
    }
    if (!e.instructionCapture.empty()) {
        bitsOf(e.instructionCapture, part->m_capture, mask);
        part->m_capture = (part->m_capture & ~uint64_t{3}) | 1u; // IEEE 1149.1: ...01
    }
    const uint64_t all = part->m_irLength >= 64 ? ~uint64_t{0} : (uint64_t{1} << part->m_irLength) - 1;
    part->m_idcodeOpcode = all;
    for (const auto& instruction : e.instructions.instructions()) {
        const Instruction kind = instructionOf(instruction.name);
        for (const std::string& code : instruction.opcodes) {
            if (code.size() != part->m_irLength) continue;
            Opcode op;
            bitsOf(code, op.value, op.mask);
            op.instruction = kind;
            if (kind == Instruction::Idcode && part->m_idcodeOpcode == all) part->m_idcodeOpcode = op.value;
            part->m_opcodes.push_back(op);
        }
    }
    if (!part->m_hasIdcode) part->m_idcodeOpcode = all;

    for (const auto& element : e.pins.elements()) part->m_pins.push_back(Pin {element.name, element.pin, -1});
    part->m_cells.resize(e.boundary.size());
    for (const Register::Cell& c : e.boundary.cells()) {
        Cell& cell = part->m_cells[c.number];
        cell.pin = c.port == "*" ? -1 : static_cast<int>(e.pins.find(c.port));
        cell.captures = Register::captures(c.function);
        cell.drives = Register::drives(c.function);
        if (!c.mergedInput.empty()) cell.mergedPin = static_cast<int>(e.pins.find(c.mergedInput));
        cell.controlCell = c.controlCell;
        cell.disableValue = c.disableValue == '1';
        if (cell.drives && cell.pin >= 0 && part->m_pins[static_cast<size_t>(cell.pin)].outputCell < 0)
            part->m_pins[static_cast<size_t>(cell.pin)].outputCell = static_cast<int>(c.number);
    }
    return part;
}

SimPart::Instruction SimPart::decode(uint64_t instruction) const
{
    for (const Opcode& op : m_opcodes)
        if ((instruction & op.mask) == op.value) return op.instruction;
    return Instruction::Bypass;
}

int SimPart::findPin(const std::string& name) const
{
    for (size_t i = 0; i < m_pins.size(); ++i)
        if (jexbsdl::equalsIgnoreCase(m_pins[i].name, name)) return static_cast<int>(i);
    for (size_t i = 0; i < m_pins.size(); ++i)
        if (!m_pins[i].package.empty() && jexbsdl::equalsIgnoreCase(m_pins[i].package, name)) return static_cast<int>(i);
    return -1;
}

} // namespace jexsim
