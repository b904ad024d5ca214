#include "JtagTransport.hpp"

namespace jexcable {

void JtagTransport::shift(const ShiftSource& in, ShiftSink& out, uint32_t count, bool tmsOnLast)
{
    for (uint32_t i = 0; i < count; ++i) {
        const bool tdo = clock(i + 1 == count ? tmsOnLast : false, in.bit(i));
        out.putBit(i, tdo);
    }
}

} // namespace jexcable
