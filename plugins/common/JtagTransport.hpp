#pragma once
// The wire side of a cable: what drives TCK, TMS and TDI and samples TDO.
// A transport knows nothing of TAP states; JtagEngine does.

#include <cstdint>

#include "ShiftSink.hpp"
#include "ShiftSource.hpp"

namespace jexcable {

class JtagTransport {
public:
    virtual ~JtagTransport() = default;

    // One TCK cycle: TMS and TDI are driven while TCK is low, TCK rises;
    // returns the TDO level sampled at that rising edge.
    virtual bool clock(bool tms, bool tdi) = 0;

    // `count` cycles while the TAPs are in Shift-IR or Shift-DR: TMS is low on
    // all of them except the last, which has tmsOnLast.  Bit i of `in` drives
    // TDI on cycle i, and TDO of cycle i goes to bit i of `out`.  The default
    // clocks bit by bit; a transport may move many bits at once.
    virtual void shift(const ShiftSource& in, ShiftSink& out, uint32_t count, bool tmsOnLast);
};

} // namespace jexcable
