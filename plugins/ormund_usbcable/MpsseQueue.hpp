// SPDX-License-Identifier: MIT
#pragma once
// The MPSSE command layer: turns TMS moves, scans and GPIO changes into the
// command bytes of FTDI's Multi-Protocol Synchronous Serial Engine, queues
// them, sends them in large writes and scatters the answers into the
// callers' buffers.
//
// Conventions (JTAG on MPSSE): TCK rests low; TDI and TMS change on the
// falling edge, TDO is sampled on the rising edge; bits go LSB first.
//  - TMS moves: 0x4B (0x6B when TDO is read), up to 7 clocks a command, TDI
//    held at the level of bit 7.
//  - Scans: whole bytes with 0x19 (write), 0x28 (read, TDI held) or 0x39
//    (both), the remaining 1-7 bits with 0x1B/0x2A/0x3B; the last bit of a
//    scan that leaves Shift-xR goes out as a one-clock TMS command with TMS
//    high, TDI = that bit, and its TDO read from bit 7 of the answer.
//  - A read-only scan of a constant TDI level first sets TDI through the
//    low GPIO byte (0x80) when it is not at that level already.
//
// Batching: commands accumulate in one buffer.  A transaction is sent when
// the caller flushes, when the buffer reaches kMaxWrite bytes, or before the
// answers would exceed the read window (the chip's IN FIFO: a synchronous
// write must not make the chip wait for a read nobody has started).  A
// transaction that expects answers ends with 0x87 (send immediate) and is
// followed by one read of exactly the expected byte count.  Answers beyond
// that count mean the chip rejected a command (0xFA, opcode).
//
// Buffers handed in as sinks (and the raw bytes of readLow/readHigh) must
// stay valid until the next flush() returns.  After a failure every later
// call does nothing until clearError(); the queued commands are dropped.

#include <cstdint>
#include <string>
#include <vector>

#include "FtdiLink.hpp"
#include "jexjtag/cable/ShiftSink.hpp"
#include "jexjtag/cable/ShiftSource.hpp"

namespace jexusb {

class MpsseQueue {
public:
    static constexpr std::size_t kMaxWrite = 64 * 1024;
    static constexpr unsigned kReadTimeoutMs = 2000;

    struct Counters {
        uint64_t writes = 0;   // transactions written
        uint64_t reads = 0;    // transactions read back
        uint64_t bytesOut = 0; // command bytes written
        uint64_t bytesIn = 0;  // answer bytes read
    };

    // `readWindow`: the most answer bytes one transaction may expect.
    // `highSpeed`: an H chip (60 MHz base clock, clock-only commands).
    MpsseQueue(FtdiLink& link, std::size_t readWindow, bool highSpeed);

    // ---- pins -------------------------------------------------------------------
    // The low byte (xDBUS0-7) and high byte (xCBUS0-7) pin values and
    // directions (1 = output).  Bits 0-3 of the low byte are TCK, TDI, TDO,
    // TMS: their directions are forced to out/out/in/out and their levels
    // follow what the queue has driven (TCK low).
    void setLow(uint8_t value, uint8_t direction);
    void setHigh(uint8_t value, uint8_t direction);
    uint8_t lowValue() const { return m_lowValue; }
    uint8_t lowDirection() const { return m_lowDir; }
    uint8_t highValue() const { return m_highValue; }
    uint8_t highDirection() const { return m_highDir; }
    // Queues a read of the pins; the byte lands in *dest at the flush.
    void readLow(uint8_t* dest);
    void readHigh(uint8_t* dest);
    bool tms() const { return m_tms; }
    bool tdi() const { return m_tdi; }

    // ---- clock --------------------------------------------------------------
    // TCK = base / (2 * (1 + divisor)); base 60 MHz with divide-by-5 off
    // (H chips), else 12 MHz.  Picks the divisor that gives the highest TCK
    // not above `hz` (the slowest one when none is that slow), queues the
    // clock commands (three-phase and adaptive clocking off on H chips) and
    // returns the resulting frequency.  hz 0 is treated as 1.
    uint32_t setFrequency(uint32_t hz);
    // Adaptive clocking (RTCK on xDBUS7): 0x96 on, 0x97 off.  H chips only.
    void setAdaptive(bool on);
    // The divisor and base for a frequency, without queueing anything.
    static uint16_t divisorFor(uint32_t hz, uint32_t baseHz);
    // Queues bytes as they are (set-up commands, probes); `answerBytes` is
    // how many answer bytes they produce (read into *dest, when given).
    void raw(const std::vector<uint8_t>& bytes, std::size_t answerBytes = 0, uint8_t* dest = nullptr);

    // ---- JTAG ----------------------------------------------------------------
    // One TCK cycle with these TMS and TDI levels; consecutive cycles with
    // the same TDI share one TMS command.
    void clockTms(bool tms, bool tdi);
    // `count` cycles with TMS and TDI held at these levels.  H chips clock
    // them without data (0x8F: 8 clocks a byte count, 0x8E: 1-8 clocks);
    // the FT2232D gets TMS commands.
    void holdClocks(uint64_t count, bool tms, bool tdi);
    // `count` cycles of a scan (TMS low), the last one with TMS = tmsOnLast.
    // TDI bit i comes from in.bit(i); TDO of cycle i goes to bit
    // (sinkOffset + i) of `out` (nothing is read when !out.wanted()).
    void shift(const jexcable::ShiftSource& in, const jexcable::ShiftSink& out, uint64_t count, bool tmsOnLast,
               uint64_t sinkOffset = 0);

    // ---- transactions ------------------------------------------------------------
    // Sends what is queued and fills the sinks.  True when all went well
    // (also when nothing was queued).
    bool flush();
    bool ok() const { return m_error.empty(); }
    const std::string& error() const { return m_error; }
    // Forgets the failure (and anything queued) so the queue can be used again.
    void clearError();
    bool pendingAnswers() const { return m_answerBytes > 0; }
    const Counters& counters() const { return m_counters; }

private:
    enum class Kind : uint8_t { Bytes, Bits, Raw };
    struct Answer {
        Kind kind;
        uint32_t count;       // bytes (Bytes, Raw) or bits (Bits)
        std::size_t at;       // position of its first byte in the answer stream
        uint64_t offset;      // sink bit offset
        jexcable::ShiftSink sink;
        uint8_t* raw;
    };

    void emitTms();
    void driveTdi(bool level);
    void lowCommand();
    void room(std::size_t commandBytes, std::size_t answerBytes);
    void expect(Kind kind, uint32_t count, const jexcable::ShiftSink& sink, uint64_t offset, uint8_t* raw);
    void fail(const std::string& text);
    void drop(); // forgets everything queued
    bool transact();
    void scatter();

    FtdiLink* m_link;
    std::size_t m_window;
    bool m_highSpeed;
    std::vector<uint8_t> m_out;
    std::vector<uint8_t> m_in;
    std::vector<Answer> m_answers;
    std::size_t m_answerBytes = 0;
    std::string m_error;
    Counters m_counters;

    uint8_t m_tmsBits = 0;   // pending TMS clocks
    unsigned m_tmsCount = 0;
    bool m_tmsTdi = false;

    bool m_tms = true;
    bool m_tdi = false;
    uint8_t m_lowValue = 0x08;
    uint8_t m_lowDir = 0x0B;
    uint8_t m_highValue = 0;
    uint8_t m_highDir = 0;
};

} // namespace jexusb
