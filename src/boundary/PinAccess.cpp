// SPDX-License-Identifier: MIT
#include "boundary/PinAccess.hpp"

#include <iterator>
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

PinAccess::PinAccess(Target& target, unsigned handle, unsigned deviceIndex, const BsdlPart& part,
                     HeldDevices& held)
    : m_target(target), m_handle(handle), m_device(deviceIndex), m_part(part), m_held(held)
{
}

std::string PinAccess::prepare()
{
    unsigned count = 0;
    if (JEX_FAILED(m_target.getDeviceCount(&count))) return "the device count cannot be read";
    m_count = count;
    if (m_device >= count)
        return "device " + std::to_string(m_device) + " is outside the chain of " + std::to_string(count) + " devices";
    for (auto it = m_held.begin(); it != m_held.end();) it = it->first >= count ? m_held.erase(it) : std::next(it);
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

std::vector<uint8_t> PinAccess::opcodeBits(const char* name, const char* alternative) const
{
    std::string opcode = m_part.opcode(name);
    if (opcode.empty() && alternative) opcode = m_part.opcode(alternative);
    // Opcodes are written most significant bit first; bit 0 goes first.
    std::vector<uint8_t> bits(opcode.size());
    for (size_t i = 0; i < opcode.size(); ++i) bits[i] = opcode[opcode.size() - 1 - i] == '1';
    return bits;
}

std::string PinAccess::loadInstruction(const char* name, const char* alternative)
{
    m_ir = opcodeBits(name, alternative);
    if (m_ir.empty()) return "the BSDL file of " + m_part.entity().name + " declares no " + name + " instruction";
    JexJtagCallContext context {m_handle, 0, nullptr};
    const bool others = m_held.size() > (m_held.count(m_device) ? 1u : 0u);
    if (!others) {
        const std::vector<unsigned char> tdi = pack(m_ir);
        if (JEX_FAILED(m_target.shiftDeviceIR(m_device, tdi.data(), nullptr, static_cast<unsigned>(m_ir.size()),
                                              nullptr, nullptr, JEXJTAG_SHIFT_WRITE, JEXJTAG_RUN_TEST_IDLE, &context)))
            return std::string("loading ") + name + " into device " + std::to_string(m_device) + " failed";
        return {};
    }
    // The whole chain's IR, device 0 (nearest TDO) first: held devices get
    // their instruction again, the others BYPASS.
    std::vector<uint8_t> chain;
    for (unsigned k = 0; k < m_count; ++k) {
        const auto held = m_held.find(k);
        if (k == m_device) {
            chain.insert(chain.end(), m_ir.begin(), m_ir.end());
        } else if (held != m_held.end()) {
            chain.insert(chain.end(), held->second.instruction.begin(), held->second.instruction.end());
        } else {
            unsigned length = 0;
            if (JEX_FAILED(m_target.getIRLength(k, &length)) || length == 0)
                return "the IR length of device " + std::to_string(k) + " is not known";
            chain.insert(chain.end(), length, 1);
        }
    }
    const std::vector<unsigned char> tdi = pack(chain);
    if (JEX_FAILED(m_target.shiftChainIR(tdi.data(), nullptr, static_cast<unsigned>(chain.size()), nullptr, nullptr,
                                         JEXJTAG_SHIFT_WRITE, JEXJTAG_RUN_TEST_IDLE, &context)))
        return std::string("loading ") + name + " into device " + std::to_string(m_device) + " failed";
    return {};
}

std::string PinAccess::shiftRegister(const std::vector<uint8_t>& in, std::vector<uint8_t>& out)
{
    JexJtagCallContext context {m_handle, 0, nullptr};
    bool others = false;
    for (const auto& [index, held] : m_held) others = others || (index != m_device && !held.boundary.empty());
    if (!others) {
        const std::vector<unsigned char> tdi = pack(in);
        std::vector<unsigned char> tdo(tdi.size(), 0);
        if (JEX_FAILED(m_target.shiftDeviceDR(m_device, tdi.data(), tdo.data(), static_cast<unsigned>(in.size()),
                                              nullptr, nullptr, JEXJTAG_SHIFT_READWRITE, JEXJTAG_RUN_TEST_IDLE,
                                              &context)))
            return "shifting the boundary register of device " + std::to_string(m_device) + " failed";
        out.resize(in.size());
        for (size_t i = 0; i < in.size(); ++i) out[i] = (tdo[i / 8] >> (i % 8)) & 1u;
        return {};
    }
    // The whole chain's DR: a held device under EXTEST gets its boundary
    // values again, the others their one BYPASS bit.
    std::vector<uint8_t> chain;
    size_t offset = 0;
    for (unsigned k = 0; k < m_count; ++k) {
        const auto held = m_held.find(k);
        if (k == m_device) {
            offset = chain.size();
            chain.insert(chain.end(), in.begin(), in.end());
        } else if (held != m_held.end() && !held->second.boundary.empty()) {
            chain.insert(chain.end(), held->second.boundary.begin(), held->second.boundary.end());
        } else {
            chain.push_back(0);
        }
    }
    const std::vector<unsigned char> tdi = pack(chain);
    std::vector<unsigned char> tdo(tdi.size(), 0);
    if (JEX_FAILED(m_target.shiftChainDR(tdi.data(), tdo.data(), static_cast<unsigned>(chain.size()), nullptr, nullptr,
                                         JEXJTAG_SHIFT_READWRITE, JEXJTAG_RUN_TEST_IDLE, &context)))
        return "shifting the boundary register of device " + std::to_string(m_device) + " failed";
    out.resize(in.size());
    for (size_t i = 0; i < in.size(); ++i) out[i] = (tdo[(offset + i) / 8] >> ((offset + i) % 8)) & 1u;
    return {};
}

void PinAccess::hold(std::vector<uint8_t> boundary)
{
    Held& held = m_held[m_device];
    held.instruction = m_ir;
    held.boundary = std::move(boundary);
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
    m_held.erase(m_device); // SAMPLE leaves the pins to the device's own logic
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
    if (error.empty()) {
        hold(bits);
        error = shiftRegister(bits, captured);
    }
    if (error.empty()) decode(captured, levels);
    return error;
}

std::string PinAccess::highz()
{
    std::string error = prepare();
    if (error.empty()) error = loadInstruction("HIGHZ");
    if (error.empty()) hold({});
    return error;
}

std::string PinAccess::clamp()
{
    std::string error = prepare();
    std::vector<uint8_t> captured;
    if (error.empty()) error = loadInstruction("PRELOAD", "SAMPLE");
    if (error.empty()) error = shiftRegister(m_part.safeBits(), captured);
    if (error.empty()) error = loadInstruction("CLAMP");
    if (error.empty()) hold({});
    return error;
}

} // namespace JexRT
