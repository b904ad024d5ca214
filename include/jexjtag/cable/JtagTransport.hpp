// SPDX-License-Identifier: MIT
#pragma once
// The wire side of a cable: what drives TCK, TMS and TDI and samples TDO.
// This is the class a cable author writes; JtagEngine turns TAP navigation
// and register shifts into calls of it, and CableBase turns the plug-in
// operations into engine calls.  A transport knows nothing of TAP states.
//
// Calls come in bulk: a TMS sequence, a whole run of shift bits with its
// source and sink, a run of idle clocks.  A transport may do each call at
// once (the simulator does) or queue it and send many together (a USB
// adapter builds one command buffer; a socket cable one write).  A queueing
// transport must complete everything queued in flush(); the engine calls
// flush() before it looks at TDO or hands TDO back to the host, and before
// sleeping.  Call order is clock order: a queue must keep it.
//
// Failures (an unplugged adapter, a dead socket, a timeout) are thrown as
// std::runtime_error with a message for the user; CableBase reports it to
// the session, fails the operation and resets the TAP before the next one.
// No call may block without a time limit.

#include <cstdint>

#include "ShiftSink.hpp"
#include "ShiftSource.hpp"

namespace jexcable {

class JtagTransport {
public:
    virtual ~JtagTransport() = default;

    // `count` clocks (1 or more) that move the TAP: the TMS level of clock i
    // is bit i of `tms` (BitBuffer order: bit i % 8 of byte i / 8), TDI is
    // held at `tdi` throughout, TDO is not wanted.
    virtual void moveTms(const uint8_t* tms, uint32_t count, bool tdi) = 0;

    // `count` clocks (1 or more) while the TAPs are in Shift-IR or Shift-DR:
    // TMS is low on all of them except the last, which has tmsOnLast (high:
    // the TAPs go to Exit1 on that clock).  Clock i drives TDI bit i of `in`
    // and its TDO goes to bit i of `out`.  The three forms a transport can
    // save traffic on:
    //   read-write  in.isConstant() false, out.wanted() true
    //   write-only  out.wanted() false: TDO is not needed
    //   read-only   in.isConstant() true: TDI is in.level() on every clock
    // A queueing transport keeps copies of `in` and `out` (small values);
    // the buffers behind them stay valid until the next flush() returns, and
    // `out` must be filled by then.
    virtual void shift(const ShiftSource& in, const ShiftSink& out, uint32_t count, bool tmsOnLast) = 0;

    // `count` clocks with TMS and TDI held (waiting in Run-Test/Idle,
    // holding Test-Logic-Reset).  The default calls moveTms in blocks.
    virtual void idleClocks(uint64_t count, bool tms, bool tdi);

    // Completes every queued call: on return the clocks have happened and
    // every queued sink holds its TDO.  The default does nothing (right for
    // a transport that does each call at once).
    virtual void flush() {}

    // One clock with these levels; returns TDO sampled at its rising edge
    // (pin-level access from the host).  The default is a one-bit read-write
    // shift whose last (only) clock has TMS `tms`, then flush().
    virtual bool clock(bool tms, bool tdi);

    // A level the host sets on a pin without clocking: TMS or TDI, TCK going
    // low, or one of the cable's own pins (numbers above JEXJTAG_TCK, which
    // its documentation lists).  A rising TCK never comes here: CableBase
    // calls clock() for it.  False when the cable has no such pin.  The
    // default accepts TDI, TMS and TCK (whose levels CableBase keeps) and
    // refuses the rest.
    virtual bool drivePin(uint32_t pin, bool level);
    // Reads a pin after everything queued (a queueing transport flushes
    // first): JEXJTAG_TDO or one of the cable's own pins.  False when it
    // cannot be read (the default for every pin).  Levels are driven in
    // queue order too.
    virtual bool readPin(uint32_t pin, bool& level);

    // Whether the cable has TRST and SRST lines (then CableBase offers the
    // options "trst" and "srst").  Default: none.
    virtual bool hasResetLines() const { return false; }
    // Asserts (true) or releases (false) the reset lines, after everything
    // queued.  Only called when hasResetLines().
    virtual void setResetLines(bool trst, bool srst);

    // Waits `microseconds` after everything queued has been clocked.  The
    // default flushes, then sleeps.
    virtual void sleep(uint32_t microseconds);
};

} // namespace jexcable
