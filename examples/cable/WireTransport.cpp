// SPDX-License-Identifier: MIT
#include "WireTransport.hpp"

#include <jexjtag/types.h>

namespace wirecable {

using jexcable::ShiftSink;
using jexcable::ShiftSource;

void WireTransport::moveTms(const uint8_t*, uint32_t count, bool tdi)
{
    // A loopback has no TAP: only the TDI level matters.
    m_queue.push_back({ShiftSource::level(tdi), ShiftSink::discard(), count});
}

void WireTransport::shift(const ShiftSource& in, const ShiftSink& out, uint32_t count, bool)
{
    m_queue.push_back({in, out, count});
}

void WireTransport::flush()
{
    if (m_queue.empty()) return;
    ++m_transfers;
    for (const Queued& q : m_queue)
        for (uint32_t i = 0; i < q.count; ++i) {
            const bool tdo = clockOnce(q.in.bit(i));
            if (q.out.wanted()) q.out.putBit(i, tdo);
        }
    m_queue.clear();
}

bool WireTransport::readPin(uint32_t pin, bool& level)
{
    if (pin != JEXJTAG_TDO || m_line.empty()) return false;
    flush();
    level = m_line[m_next];
    return true;
}

bool WireTransport::clockOnce(bool tdi)
{
    ++m_clocks;
    if (m_line.empty()) return tdi;
    const bool tdo = m_line[m_next];
    m_line[m_next] = tdi;
    m_next = (m_next + 1) % m_line.size();
    return tdo;
}

} // namespace wirecable
