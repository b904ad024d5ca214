#pragma once
// The TAP logic of a cable driver: follows the state that it drives the
// chain's TAP controllers into and turns navigation and register shifts into
// TMS/TDI sequences on a JtagTransport.
//
// Navigation takes the shortest TMS path (TapController::path).  While it
// moves the TAP, TDI is held high, so a bit that leaves a Shift state on the
// way shifts a 1 (the BYPASS instruction's bit) into the chain.
//
// A shift moves to Shift-IR or Shift-DR (from the other Shift or a Pause
// state of the same register this continues the scan without a new Capture),
// clocks padBefore high bits, the data bits and padAfter high bits, and
// leaves the TAP in the exit state: staying in the same Shift state when that
// is the exit state, else through Exit1 and the shortest path from there.
// TDO of the data bits goes to the sink; TDO of the padding is dropped.

#include <cstdint>

#include "JtagTransport.hpp"
#include "TapController.hpp"

namespace jexcable {

class JtagEngine {
public:
    enum class Register { Instruction, Data };

    // The engine starts believing the TAP is in Test-Logic-Reset; call
    // resetTap() when that is not known.
    explicit JtagEngine(JtagTransport& transport) : m_transport(&transport) {}

    JexJtagTapState state() const { return m_tap.state(); }
    JtagTransport& transport() { return *m_transport; }

    // Five clocks with TMS high: Test-Logic-Reset from any state.
    void resetTap();
    // The shortest path to `state`.
    void moveTo(JexJtagTapState state);
    // `count` clocks that keep the current stable state; false (nothing
    // clocked) when the state is not stable and count > 0.
    bool holdClocks(uint32_t count);
    // One clock with the given levels, as a pin-level driver does it; the
    // followed state moves with it.  Returns TDO.
    bool clock(bool tms, bool tdi);

    void shift(Register reg, const ShiftSource& in, ShiftSink& out, uint32_t bitCount,
               JexJtagTapState exitState, uint64_t padBefore = 0, uint64_t padAfter = 0);

    // Convenience for whole-chain reads: shifts bitCount bits of a constant
    // TDI level into the register, TDO into out (which must hold the bits).
    void shiftLevel(Register reg, bool tdi, uint8_t* out, uint32_t bitCount, JexJtagTapState exitState);

private:
    void clockPath(TapController::Path path);
    void padding(uint64_t bits, bool last);

    JtagTransport* m_transport;
    TapController m_tap;
};

} // namespace jexcable
