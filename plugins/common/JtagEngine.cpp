// SPDX-License-Identifier: MIT
#include "jexjtag/cable/JtagEngine.hpp"

namespace jexcable {

void JtagEngine::movePath(TapController::Path path, JexJtagTapState to)
{
    if (path.length == 0) return;
    m_transport->moveTms(&path.tms, path.length, true);
    m_tap.setState(to);
    m_clocks += path.length;
    m_lastTms = path.tmsAt(path.length - 1u);
    m_lastTdi = true;
}

void JtagEngine::resetTap()
{
    const uint8_t ones = 0x1F;
    m_transport->moveTms(&ones, 5, true);
    m_tap.setState(JEXJTAG_TEST_LOGIC_RESET);
    m_stateKnown = true;
    m_clocks += 5;
    m_lastTms = true;
    m_lastTdi = true;
}

void JtagEngine::moveTo(JexJtagTapState state)
{
    if (!m_stateKnown) resetTap();
    movePath(TapController::path(m_tap.state(), state), state);
}

bool JtagEngine::holdClocks(uint32_t count)
{
    if (count == 0) return true;
    if (!m_stateKnown) resetTap();
    if (!TapController::isStable(m_tap.state())) return false;
    if (TapController::isShift(m_tap.state())) {
        transportShift(ShiftSource::level(true), ShiftSink::discard(), count, false);
        return true;
    }
    const bool tms = TapController::holdingTms(m_tap.state());
    m_transport->idleClocks(count, tms, true);
    m_clocks += count;
    m_lastTms = tms;
    m_lastTdi = true;
    return true;
}

bool JtagEngine::clock(bool tms, bool tdi)
{
    const bool tdo = m_transport->clock(tms, tdi);
    m_tap.clock(tms);
    ++m_clocks;
    m_lastTms = tms;
    m_lastTdi = tdi;
    return tdo;
}

void JtagEngine::transportShift(const ShiftSource& in, const ShiftSink& out, uint32_t count, bool tmsOnLast)
{
    m_transport->shift(in, out, count, tmsOnLast);
    m_clocks += count;
    m_lastTms = tmsOnLast;
    m_lastTdi = in.bit(count - 1u);
}

void JtagEngine::padding(uint64_t bits, bool last)
{
    const ShiftSource ones = ShiftSource::level(true);
    while (bits > 0) {
        const uint32_t n = bits > 0x80000000u ? 0x80000000u : static_cast<uint32_t>(bits);
        bits -= n;
        transportShift(ones, ShiftSink::discard(), n, last && bits == 0);
    }
}

void JtagEngine::shift(Register reg, const ShiftSource& in, const ShiftSink& out, uint32_t bitCount,
                       JexJtagTapState exitState, uint64_t padBefore, uint64_t padAfter)
{
    const JexJtagTapState shiftState = reg == Register::Instruction ? JEXJTAG_SHIFT_IR : JEXJTAG_SHIFT_DR;
    const uint64_t total = padBefore + bitCount + padAfter;
    if (total == 0) {
        moveTo(exitState);
        return;
    }
    moveTo(shiftState);
    const bool leave = exitState != shiftState;
    padding(padBefore, leave && bitCount == 0 && padAfter == 0);
    if (bitCount > 0) transportShift(in, out, bitCount, leave && padAfter == 0);
    padding(padAfter, leave);
    if (leave) {
        m_tap.clock(true); // the last bit went with TMS high: Exit1
        moveTo(exitState);
    }
    if (bitCount > 0 && out.wanted()) m_transport->flush();
}

void JtagEngine::shiftLevel(Register reg, bool tdi, uint8_t* out, uint32_t bitCount, JexJtagTapState exitState)
{
    shift(reg, ShiftSource::level(tdi), ShiftSink::buffer(out), bitCount, exitState);
}

} // namespace jexcable
