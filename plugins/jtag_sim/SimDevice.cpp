// SPDX-License-Identifier: MIT
#include "SimDevice.hpp"

#include "SimPart.hpp"

namespace jexsim {

namespace {

uint64_t resetInstruction(const DeviceSpec& description)
{
    return description.hasIdcode ? description.idcodeOpcode : description.bypassOpcode();
}

} // namespace

SimDevice::SimDevice(const DeviceSpec& description) : m_spec(description), m_instruction(resetInstruction(description))
{
    if (m_spec.part) m_latch.assign(m_spec.part->cells().size(), 0);
}

SimDevice::DataRegister SimDevice::selected() const
{
    if (m_spec.part) {
        switch (m_spec.part->decode(m_instruction)) {
        case SimPart::Instruction::Idcode: return m_spec.hasIdcode ? DataRegister::Idcode : DataRegister::Bypass;
        case SimPart::Instruction::Sample:
        case SimPart::Instruction::Extest: return m_latch.empty() ? DataRegister::Bypass : DataRegister::Boundary;
        default: return DataRegister::Bypass;
        }
    }
    if (m_spec.hasIdcode && m_instruction == m_spec.idcodeOpcode) return DataRegister::Idcode;
    if (m_instruction == m_spec.userOpcode) return DataRegister::User;
    return DataRegister::Bypass;
}

bool SimDevice::drives(int pin, bool& level) const
{
    if (!m_spec.part || pin < 0) return false;
    const SimPart::Instruction mode = m_spec.part->decode(m_instruction);
    if (mode != SimPart::Instruction::Extest && mode != SimPart::Instruction::Clamp) return false;
    const int out = m_spec.part->pins()[static_cast<std::size_t>(pin)].outputCell;
    if (out < 0) return false;
    const SimPart::Cell& cell = m_spec.part->cells()[static_cast<std::size_t>(out)];
    if (cell.controlCell >= 0 && (m_latch[static_cast<std::size_t>(cell.controlCell)] != 0) == cell.disableValue)
        return false;
    level = m_latch[static_cast<std::size_t>(out)] != 0;
    return true;
}

void SimDevice::capture(JexJtagTapState state)
{
    m_wideActive = false;
    if (state == JEXJTAG_CAPTURE_IR) {
        m_shift = m_spec.irCapture;
        m_shiftLength = m_spec.irLength;
        return;
    }
    switch (selected()) {
    case DataRegister::Idcode:
        m_shift = m_spec.idcode;
        m_shiftLength = 32;
        break;
    case DataRegister::User:
        m_shift = m_user;
        m_shiftLength = m_spec.userBits;
        break;
    case DataRegister::Bypass:
        m_shift = 0;
        m_shiftLength = 1;
        break;
    case DataRegister::Boundary:
        captureBoundary();
        break;
    }
}

void SimDevice::captureBoundary()
{
    const std::vector<SimPart::Cell>& cells = m_spec.part->cells();
    const std::size_t n = cells.size();
    m_wide.assign((n + 63) / 64, 0);
    for (std::size_t i = 0; i < n; ++i) {
        const SimPart::Cell& cell = cells[i];
        bool bit;
        if (cell.captures && cell.pin >= 0 && m_env) bit = m_env->pinLevel(m_index, cell.pin);
        else if (cell.mergedPin >= 0 && m_env) bit = m_env->pinLevel(m_index, cell.mergedPin);
        else bit = m_latch[i] != 0;
        if (bit) m_wide[i / 64] |= uint64_t{1} << (i % 64);
    }
    m_shiftLength = static_cast<unsigned>(n);
    m_wideActive = true;
}

void SimDevice::shiftWide(bool tdi)
{
    const std::size_t words = m_wide.size();
    for (std::size_t k = 0; k < words; ++k) m_wide[k] = (m_wide[k] >> 1) | (k + 1 < words ? m_wide[k + 1] << 63 : 0);
    const std::size_t top = m_shiftLength - 1;
    if (tdi) m_wide[top / 64] |= uint64_t{1} << (top % 64);
}

uint64_t SimDevice::shiftWideWord(uint64_t in, unsigned count)
{
    const std::size_t n = m_shiftLength;
    if (n < 64) { // short register: bit by bit
        uint64_t out = 0;
        for (unsigned i = 0; i < count; ++i) {
            out |= (m_wide[0] & 1u) << i;
            shiftWide(((in >> i) & 1u) != 0);
        }
        return out;
    }
    const uint64_t mask = count >= 64 ? ~uint64_t{0} : (uint64_t{1} << count) - 1;
    const uint64_t out = m_wide[0] & mask;
    const std::size_t words = m_wide.size();
    for (std::size_t k = 0; k < words; ++k) {
        const uint64_t next = k + 1 < words ? m_wide[k + 1] : 0;
        m_wide[k] = count >= 64 ? next : (m_wide[k] >> count) | (next << (64 - count));
    }
    // The new bits enter at the top: positions n - count .. n - 1.
    const uint64_t bits = in & mask;
    const std::size_t pos = n - count;
    m_wide[pos / 64] |= bits << (pos % 64);
    if (pos % 64 != 0 && pos / 64 + 1 < words) m_wide[pos / 64 + 1] |= bits >> (64 - pos % 64);
    return out;
}

void SimDevice::enter(JexJtagTapState state)
{
    m_shifting = state == JEXJTAG_SHIFT_IR || state == JEXJTAG_SHIFT_DR;
    switch (state) {
    case JEXJTAG_TEST_LOGIC_RESET:
        m_instruction = resetInstruction(m_spec);
        break;
    case JEXJTAG_UPDATE_IR:
        m_instruction = m_shift;
        break;
    case JEXJTAG_UPDATE_DR:
        if (m_wideActive) {
            for (std::size_t i = 0; i < m_latch.size(); ++i) m_latch[i] = (m_wide[i / 64] >> (i % 64)) & 1u;
        } else if (selected() == DataRegister::User) {
            m_user = m_shift;
        }
        break;
    default:
        break;
    }
}

} // namespace jexsim
