#include "SimDevice.hpp"

namespace jexsim {

namespace {

uint64_t resetInstruction(const DeviceSpec& description)
{
    return description.hasIdcode ? description.idcodeOpcode : description.bypassOpcode();
}

} // namespace

SimDevice::SimDevice(const DeviceSpec& description) : m_spec(description), m_instruction(resetInstruction(description)) {}

SimDevice::DataRegister SimDevice::selected() const
{
    if (m_spec.hasIdcode && m_instruction == m_spec.idcodeOpcode) return DataRegister::Idcode;
    if (m_instruction == m_spec.userOpcode) return DataRegister::User;
    return DataRegister::Bypass;
}

void SimDevice::capture(JexJtagTapState state)
{
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
    }
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
        if (selected() == DataRegister::User) m_user = m_shift;
        break;
    default:
        break;
    }
}

} // namespace jexsim
