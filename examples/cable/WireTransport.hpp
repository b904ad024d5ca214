// SPDX-License-Identifier: MIT
#pragma once
// The transport of the example cable: a loopback on which TDO is TDI
// delayed by a fixed number of clocks (0: a plain wire).  It queues every
// call and does the queue at flush(), as a USB or socket cable does with its
// command buffer, so it also shows what the SDK asks of a queueing transport:
// the sinks of queued shifts are filled by flush(), and the engine calls
// flush() before it reads them.

#include <cstdint>
#include <vector>

#include <jexjtag/cable/JtagTransport.hpp>

namespace wirecable {

class WireTransport : public jexcable::JtagTransport {
public:
    explicit WireTransport(unsigned delay) : m_line(delay, false) {}

    void moveTms(const uint8_t* tms, uint32_t count, bool tdi) override;
    void shift(const jexcable::ShiftSource& in, const jexcable::ShiftSink& out, uint32_t count,
               bool tmsOnLast) override;
    void flush() override;
    // TDO: the bit that the next clock brings out.
    bool readPin(uint32_t pin, bool& level) override;

    // Clocks done and flushes that had work (the "round trips").
    uint64_t clocks() const { return m_clocks; }
    uint64_t transfers() const { return m_transfers; }

private:
    struct Queued {
        jexcable::ShiftSource in;
        jexcable::ShiftSink out;
        uint32_t count;
    };

    bool clockOnce(bool tdi);

    std::vector<Queued> m_queue;
    std::vector<bool> m_line; // the delay line, m_next leaves first
    std::size_t m_next = 0;
    uint64_t m_clocks = 0;
    uint64_t m_transfers = 0;
};

} // namespace wirecable
