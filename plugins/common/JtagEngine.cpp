#include "JtagEngine.hpp"

namespace jexcable {

void JtagEngine::clockPath(TapController::Path path)
{
    for (unsigned i = 0; i < path.length; ++i) {
        const bool tms = path.tmsAt(i);
        m_transport->clock(tms, true);
        m_tap.clock(tms);
    }
}

void JtagEngine::resetTap()
{
    for (int i = 0; i < 5; ++i) m_transport->clock(true, true);
    m_tap.setState(JEXJTAG_TEST_LOGIC_RESET);
}

void JtagEngine::moveTo(JexJtagTapState state)
{
    clockPath(TapController::path(m_tap.state(), state));
}

bool JtagEngine::holdClocks(uint32_t count)
{
    if (count == 0) return true;
    if (!TapController::isStable(m_tap.state())) return false;
    const bool tms = TapController::holdingTms(m_tap.state());
    if (TapController::isShift(m_tap.state())) {
        ShiftSink none = ShiftSink::discard();
        m_transport->shift(ShiftSource::level(true), none, count, false);
        return true;
    }
    for (uint32_t i = 0; i < count; ++i) m_transport->clock(tms, true);
    return true;
}

bool JtagEngine::clock(bool tms, bool tdi)
{
    const bool tdo = m_transport->clock(tms, tdi);
    m_tap.clock(tms);
    return tdo;
}

void JtagEngine::padding(uint64_t bits, bool last)
{
    ShiftSink none = ShiftSink::discard();
    const ShiftSource ones = ShiftSource::level(true);
    while (bits > 0) {
        const uint32_t n = bits > 0x80000000u ? 0x80000000u : static_cast<uint32_t>(bits);
        bits -= n;
        m_transport->shift(ones, none, n, last && bits == 0);
    }
}

void JtagEngine::shift(Register reg, const ShiftSource& in, ShiftSink& out, uint32_t bitCount,
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
    if (bitCount > 0) m_transport->shift(in, out, bitCount, leave && padAfter == 0);
    padding(padAfter, leave);
    if (leave) {
        m_tap.clock(true); // the last bit went with TMS high: Exit1
        moveTo(exitState);
    }
}

void JtagEngine::shiftLevel(Register reg, bool tdi, uint8_t* out, uint32_t bitCount, JexJtagTapState exitState)
{
    ShiftSink sink = ShiftSink::buffer(out);
    shift(reg, ShiftSource::level(tdi), sink, bitCount, exitState);
}

} // namespace jexcable
