// SPDX-License-Identifier: MIT
#include "boundary/PinAccess.hpp"

#include <map>

#include "target/Target.hpp"

namespace JexRT {

namespace {

// Register bits (one byte per bit, bit 0 first) to the ABI's packed buffer.
std::vector<unsigned char> pack(const std::vector<uint8_t>& bits)
{
    std::vector<unsigned char> out((bits.size() + 7) / 8, 0);
    for (size_t i = 0; i < bits.size(); ++i)
        if (bits[i]) out[i / 8] |= static_cast<unsigned char>(1u << (i % 8));
    return out;
}

} // namespace

PinAccess::PinAccess(Target& target, unsigned handle, unsigned deviceIndex, const BsdlPart& part)
    : m_target(target), m_handle(handle), m_device(deviceIndex), m_part(part)
{
}

std::string PinAccess::prepare()
{
    unsigned count = 0;
    if (JEX_FAILED(m_target.getDeviceCount(&count))) return "the device count cannot be read";
    if (m_device >= count)
        return "device " + std::to_string(m_device) + " is outside the chain of " + std::to_string(count) + " devices";
    if (m_part.entity().boundary.empty()) return "the BSDL file describes no boundary register";
    unsigned irLength = 0;
    const unsigned wanted = m_part.entity().instructionLength;
    if (JEX_FAILED(m_target.getIRLength(m_device, &irLength)) || irLength != wanted) {
        if (JEX_FAILED(m_target.setIRLength(m_device, wanted)))
            return "the IR length of device " + std::to_string(m_device) + " cannot be set to " +
                   std::to_string(wanted);
    }
    return {};
}

std::string PinAccess::loadInstruction(const char* name, const char* alternative)
{
    std::string opcode = m_part.opcode(name);
    if (opcode.empty() && alternative) opcode = m_part.opcode(alternative);
    if (opcode.empty())
        return "the BSDL file of " + m_part.entity().name + " declares no " + name + " instruction";
    // Opcodes are written most significant bit first; bit 0 goes first.
    std::vector<uint8_t> bits(opcode.size());
    for (size_t i = 0; i < opcode.size(); ++i) bits[i] = opcode[opcode.size() - 1 - i] == '1';
    const std::vector<unsigned char> tdi = pack(bits);
    JexJtagCallContext context {m_handle, 0, nullptr};
    if (JEX_FAILED(m_target.shiftDeviceIR(m_device, tdi.data(), nullptr, static_cast<unsigned>(bits.size()), nullptr,
                                          nullptr, JEXJTAG_SHIFT_WRITE, JEXJTAG_RUN_TEST_IDLE, &context)))
        return std::string("loading ") + name + " into device " + std::to_string(m_device) + " failed";
    return {};
}

std::string PinAccess::shiftRegister(const std::vector<uint8_t>& in, std::vector<uint8_t>& out)
{
    const std::vector<unsigned char> tdi = pack(in);
    std::vector<unsigned char> tdo(tdi.size(), 0);
    JexJtagCallContext context {m_handle, 0, nullptr};
    if (JEX_FAILED(m_target.shiftDeviceDR(m_device, tdi.data(), tdo.data(), static_cast<unsigned>(in.size()), nullptr,
                                          nullptr, JEXJTAG_SHIFT_READWRITE, JEXJTAG_RUN_TEST_IDLE, &context)))
        return "shifting the boundary register of device " + std::to_string(m_device) + " failed";
    out.resize(in.size());
    for (size_t i = 0; i < in.size(); ++i) out[i] = (tdo[i / 8] >> (i % 8)) & 1u;
    return {};
}

void PinAccess::decode(const std::vector<uint8_t>& cells, std::vector<int8_t>& levels) const
{
    const auto& pins = m_part.pins();
    levels.assign(pins.size(), -1);
    for (size_t i = 0; i < pins.size(); ++i)
        if (pins[i].inputCell >= 0 && static_cast<size_t>(pins[i].inputCell) < cells.size())
            levels[i] = static_cast<int8_t>(cells[static_cast<size_t>(pins[i].inputCell)]);
}

std::string PinAccess::sample(std::vector<int8_t>& levels, std::vector<uint8_t>& cells)
{
    std::string error = prepare();
    if (error.empty()) error = loadInstruction("SAMPLE", "PRELOAD");
    if (error.empty()) error = shiftRegister(m_part.safeBits(), cells);
    if (error.empty()) decode(cells, levels);
    return error;
}

std::string PinAccess::extest(const std::vector<std::pair<size_t, char>>& settings, std::vector<int8_t>& levels)
{
    const auto& pins = m_part.pins();
    const auto& cells = m_part.entity().boundary.cells();
    std::vector<uint8_t> bits = m_part.safeBits();
    std::map<int, size_t> controlOwner; // control cell -> setting that set it
    std::vector<bool> named(pins.size(), false);
    for (size_t k = 0; k < settings.size(); ++k) {
        const auto& [index, value] = settings[k];
        const BsdlPart::Pin& pin = pins[index];
        if (named[index]) return "pin " + pin.port + " is named twice";
        named[index] = true;
        if (pin.outputCell < 0) return "pin " + pin.port + " has no output cell; it cannot be driven";
        const BsdlPart::Cell& out = cells[static_cast<size_t>(pin.outputCell)];
        const bool release = value == 'z' || value == 'Z';
        if (pin.controlCell < 0) {
            if (release) return "pin " + pin.port + " has no control cell; it cannot be released";
            bits[static_cast<size_t>(pin.outputCell)] = value == '1';
            continue;
        }
        const uint8_t disable = out.disableValue == '1';
        if (pin.controlCell == pin.outputCell) { // open drain: its own value releases it
            bits[static_cast<size_t>(pin.outputCell)] = release ? disable : value == '1';
            continue;
        }
        const uint8_t control = release ? disable : static_cast<uint8_t>(!disable);
        const auto owner = controlOwner.find(pin.controlCell);
        if (owner != controlOwner.end() && bits[static_cast<size_t>(pin.controlCell)] != control)
            return "pins " + pins[settings[owner->second].first].port + " and " + pin.port +
                   " share control cell " + std::to_string(pin.controlCell) + " and cannot be both driven and released";
        controlOwner.emplace(pin.controlCell, k);
        bits[static_cast<size_t>(pin.controlCell)] = control;
        if (!release) bits[static_cast<size_t>(pin.outputCell)] = value == '1';
    }

    std::string error = prepare();
    std::vector<uint8_t> captured;
    if (error.empty()) error = loadInstruction("PRELOAD", "SAMPLE");
    if (error.empty()) error = shiftRegister(bits, captured);
    if (error.empty()) error = loadInstruction("EXTEST");
    if (error.empty()) error = shiftRegister(bits, captured);
    if (error.empty()) decode(captured, levels);
    return error;
}

std::string PinAccess::highz()
{
    std::string error = prepare();
    if (error.empty()) error = loadInstruction("HIGHZ");
    return error;
}

std::string PinAccess::clamp()
{
    std::string error = prepare();
    std::vector<uint8_t> captured;
    if (error.empty()) error = loadInstruction("PRELOAD", "SAMPLE");
    if (error.empty()) error = shiftRegister(m_part.safeBits(), captured);
    if (error.empty()) error = loadInstruction("CLAMP");
    return error;
}

} // namespace JexRT
