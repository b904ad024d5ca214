// SPDX-License-Identifier: MIT
#pragma once
// The TAP logic of a cable driver: follows the state that it drives the
// chain's TAP controllers into and turns navigation and register shifts into
// bulk TMS moves and shifts on a JtagTransport.
//
// Navigation takes the shortest TMS path (TapController::path) as one
// moveTms call.  While it moves the TAP, TDI is held high, so a bit that
// leaves a Shift state on the way shifts a 1 (the BYPASS instruction's bit)
// into the chain.
//
// A shift moves to Shift-IR or Shift-DR (from the other Shift or a Pause
// state of the same register this continues the scan without a new Capture),
// clocks padBefore high bits, the data bits and padAfter high bits, and
// leaves the TAP in the exit state: staying in the same Shift state when that
// is the exit state, else through Exit1 (TMS high on the last bit) and the
// shortest path from there.  TDO of the data bits goes to the sink; TDO of
// the padding is not asked for.  A shift whose TDO is wanted ends with
// transport().flush(), so a queueing transport sends the whole scan (moves,
// padding, data, exit) in one go and the sink is filled on return.
//
// The engine also counts the clocks it has driven and remembers the TMS and
// TDI levels of the last one (what the pins show after an operation).

#include <cstdint>

#include "JtagTransport.hpp"
#include "TapController.hpp"

namespace jexcable {

class JtagEngine {
public:
    enum class Register { Instruction, Data };

    // The engine starts believing the TAP is in Test-Logic-Reset; call
    // resetTap() when that is not known.  The transport is not owned and
    // must outlive the engine.
    explicit JtagEngine(JtagTransport& transport) : m_transport(&transport) {}

    JexJtagTapState state() const { return m_tap.state(); }
    JtagTransport& transport() { return *m_transport; }

    // Five clocks with TMS high: Test-Logic-Reset from any state.
    void resetTap();
    // The shortest path to `state` (after a reset when the state is not
    // known, see forgetState()).
    void moveTo(JexJtagTapState state);
    // `count` clocks that keep the current stable state; false (nothing
    // clocked) when the state is not stable and count > 0.
    bool holdClocks(uint32_t count);
    // One clock with the given levels, as a pin-level driver does it; the
    // followed state moves with it.  Returns TDO.
    bool clock(bool tms, bool tdi);

    void shift(Register reg, const ShiftSource& in, const ShiftSink& out, uint32_t bitCount,
               JexJtagTapState exitState, uint64_t padBefore = 0, uint64_t padAfter = 0);

    // Convenience for whole-chain reads: shifts bitCount bits of a constant
    // TDI level into the register, TDO into out (which must hold the bits).
    void shiftLevel(Register reg, bool tdi, uint8_t* out, uint32_t bitCount, JexJtagTapState exitState);

    // After a transport failure the TAP may be anywhere: the next move
    // starts with resetTap().
    void forgetState() { m_stateKnown = false; }

    // Clocks driven so far, and the TMS and TDI levels of the last one.
    uint64_t clocks() const { return m_clocks; }
    bool lastTms() const { return m_lastTms; }
    bool lastTdi() const { return m_lastTdi; }

private:
    void movePath(TapController::Path path, JexJtagTapState to);
    void padding(uint64_t bits, bool last);
    void transportShift(const ShiftSource& in, const ShiftSink& out, uint32_t count, bool tmsOnLast);

    JtagTransport* m_transport;
    TapController m_tap;
    bool m_stateKnown = true;
    uint64_t m_clocks = 0;
    bool m_lastTms = true;
    bool m_lastTdi = true;
};

} // namespace jexcable
