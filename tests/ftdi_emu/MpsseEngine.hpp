// SPDX-License-Identifier: MIT
#pragma once
// One MPSSE channel of an emulated FTDI chip, as FTDI's AN_108 describes
// the command processor: the bytes the host writes are commands; answers
// queue up in the chip's IN buffer and leave in USB packets of
// `packetSize` bytes, each starting with two modem-status bytes.
//
// The JTAG pins drive a simulated chain (jtag_sim's SimChain): every TCK
// cycle of a shift or TMS command is one SimChain clock with the TMS and TDI
// levels the chip drives; TDO is sampled at the rising edge.  Both edge
// options of the shift opcodes are accepted and treated alike (the model has
// no propagation delay).  Commands with bit 7 set that the chip does not know
// (or the H-only ones on an FT2232D, or opcodes listed as rejected) answer
// 0xFA and the opcode.  A command split over two writes waits for its rest.
//
// The IN buffer is handed out when the host sent 0x87 (send immediate), when
// it holds a full packet, or when the latency timer has run out since the
// last answer byte, as the chip does.

#include <chrono>
#include <cstdint>
#include <set>
#include <vector>

#include "SimChain.hpp"

namespace ftdiemu {

class MpsseEngine {
public:
    MpsseEngine(jexsim::SimChain& chain, bool highSpeed, std::size_t packetSize, std::size_t fifoSize,
                std::set<uint8_t> rejected);

    // Channel mode changes (SET_BITMODE): MPSSE on or off.  Turning it on
    // resets the engine as the chip does (divide-by-5 on, adaptive and
    // three-phase clocking off, loopback off).
    void setMpsse(bool on);
    bool mpsse() const { return m_mpsse; }
    void setLatency(unsigned ms) { m_latencyMs = ms == 0 ? 1 : ms; }
    unsigned latency() const { return m_latencyMs; }
    // Purges the chip's buffers (host-to-chip and chip-to-host).
    void purge();

    // Consumes written bytes.  False when the IN buffer grew beyond the
    // chip's FIFO: a real chip would stop taking commands and the write
    // would time out.
    bool write(const uint8_t* data, std::size_t size);
    // Fills one bulk IN transfer of up to `capacity` bytes: whole packets of
    // status bytes and payload; just the status bytes when nothing is due.
    std::size_t read(uint8_t* out, std::size_t capacity);

    // What tests look at.
    uint16_t divisor() const { return m_divisor; }
    bool divideBy5() const { return m_divideBy5; }
    bool adaptive() const { return m_adaptive; }
    bool threePhase() const { return m_threePhase; }
    uint32_t tckHz() const;
    uint16_t pins() const; // levels of xCBUS (high byte) and xDBUS (low byte)
    uint16_t directions() const { return static_cast<uint16_t>(m_highDir << 8 | m_lowDir); }
    uint64_t badCommands() const { return m_badCommands; }

private:
    std::size_t command(const uint8_t* p, std::size_t n); // bytes used, 0 when incomplete
    bool clock(bool tms, bool tdi);
    void shiftCommand(uint8_t op, const uint8_t* args, std::size_t count);
    void answer(uint8_t byte);
    bool tmsPin() const { return (m_lowValue & 0x08) != 0; }
    bool tdiPin() const { return (m_lowValue & 0x02) != 0; }
    void setTdi(bool level) { m_lowValue = static_cast<uint8_t>(level ? m_lowValue | 0x02 : m_lowValue & ~0x02); }
    void setTms(bool level) { m_lowValue = static_cast<uint8_t>(level ? m_lowValue | 0x08 : m_lowValue & ~0x08); }

    jexsim::SimChain* m_chain;
    bool m_highSpeed;
    std::size_t m_packetSize;
    std::size_t m_fifoSize;
    std::set<uint8_t> m_rejected;

    bool m_mpsse = false;
    unsigned m_latencyMs = 16;
    std::vector<uint8_t> m_pendingCommand; // an incomplete command
    std::vector<uint8_t> m_in;             // the IN buffer
    std::size_t m_releasable = 0;          // bytes of m_in that a send-immediate released
    std::chrono::steady_clock::time_point m_lastAnswer;

    uint8_t m_lowValue = 0;
    uint8_t m_lowDir = 0;
    uint8_t m_highValue = 0;
    uint8_t m_highDir = 0;
    uint16_t m_divisor = 0;
    bool m_divideBy5 = true;
    bool m_adaptive = false;
    bool m_threePhase = false;
    bool m_loopback = false;
    uint64_t m_badCommands = 0;
};

} // namespace ftdiemu
