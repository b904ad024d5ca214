// SPDX-License-Identifier: MIT
#include "MpsseQueue.hpp"

#include <algorithm>
#include <cstdio>

namespace jexusb {

using jexcable::ShiftSink;
using jexcable::ShiftSource;

namespace {

// MPSSE opcodes used here (FTDI AN_108 names in the comments).
constexpr uint8_t kWriteBytes = 0x19;    // bytes out on -ve edge, LSB first
constexpr uint8_t kWriteBits = 0x1B;     // bits out on -ve edge, LSB first
constexpr uint8_t kReadBytes = 0x28;     // bytes in on +ve edge, LSB first
constexpr uint8_t kReadBits = 0x2A;      // bits in on +ve edge, LSB first
constexpr uint8_t kReadWriteBytes = 0x39; // out -ve, in +ve, LSB first
constexpr uint8_t kReadWriteBits = 0x3B;
constexpr uint8_t kTms = 0x4B;     // TMS out on -ve edge, bit 7 = TDI
constexpr uint8_t kTmsRead = 0x6B; // the same, TDO read on +ve edge
constexpr uint8_t kSetLow = 0x80;
constexpr uint8_t kGetLow = 0x81;
constexpr uint8_t kSetHigh = 0x82;
constexpr uint8_t kGetHigh = 0x83;
constexpr uint8_t kDivisor = 0x86;
constexpr uint8_t kSendImmediate = 0x87;
constexpr uint8_t kClockBits = 0x8E;  // 1-8 TCK pulses, no data (H chips)
constexpr uint8_t kClockBytes = 0x8F; // 8 to 524288 TCK pulses, no data (H chips)
constexpr uint8_t kDivBy5Off = 0x8A;
constexpr uint8_t kDivBy5On = 0x8B;
constexpr uint8_t kThreePhaseOff = 0x8D;
constexpr uint8_t kAdaptiveOn = 0x96;
constexpr uint8_t kAdaptiveOff = 0x97;
constexpr uint8_t kBadCommand = 0xFA;

constexpr uint32_t kBase60 = 60000000u;
constexpr uint32_t kBase12 = 12000000u;
constexpr std::size_t kMaxBytesPerCommand = 65536;

} // namespace

MpsseQueue::MpsseQueue(FtdiLink& link, std::size_t readWindow, bool highSpeed)
    : m_link(&link), m_window(std::max<std::size_t>(readWindow, 16)), m_highSpeed(highSpeed)
{
    m_out.reserve(kMaxWrite);
}

// ---- queueing -----------------------------------------------------------------------

void MpsseQueue::room(std::size_t commandBytes, std::size_t answerBytes)
{
    // One byte stays free for the send-immediate at the end.
    if (m_out.size() + commandBytes + 1 > kMaxWrite || (answerBytes > 0 && m_answerBytes + answerBytes > m_window))
        transact();
}

void MpsseQueue::expect(Kind kind, uint32_t count, const ShiftSink& sink, uint64_t offset, uint8_t* raw)
{
    const std::size_t at = m_answerBytes;
    m_answerBytes += kind == Kind::Bits ? 1u : count;
    if (kind != Kind::Raw && !sink.wanted()) return;
    if (kind == Kind::Raw && !raw) return;
    m_answers.push_back(Answer{kind, count, at, offset, sink, raw});
}

void MpsseQueue::emitTms()
{
    if (m_tmsCount == 0) return;
    const uint8_t bits = static_cast<uint8_t>(m_tmsBits | (m_tmsTdi ? 0x80u : 0u));
    const auto length = static_cast<uint8_t>(m_tmsCount - 1);
    m_tmsCount = 0;
    m_tmsBits = 0;
    room(3, 0);
    m_out.insert(m_out.end(), {kTms, length, bits});
}

void MpsseQueue::lowCommand()
{
    emitTms();
    room(3, 0);
    const auto value = static_cast<uint8_t>((m_lowValue & 0xF0u) | (m_tms ? 0x08u : 0u) | (m_tdi ? 0x02u : 0u));
    const auto direction = static_cast<uint8_t>((m_lowDir & 0xF0u) | 0x0Bu);
    m_lowValue = value;
    m_lowDir = direction;
    m_out.insert(m_out.end(), {kSetLow, value, direction});
}

void MpsseQueue::driveTdi(bool level)
{
    if (m_tdi == level) return;
    emitTms();
    m_tdi = level;
    lowCommand();
}

void MpsseQueue::setLow(uint8_t value, uint8_t direction)
{
    if (!ok()) return;
    emitTms();
    m_lowValue = value;
    m_lowDir = direction;
    lowCommand();
}

void MpsseQueue::setHigh(uint8_t value, uint8_t direction)
{
    if (!ok()) return;
    emitTms();
    room(3, 0);
    m_highValue = value;
    m_highDir = direction;
    m_out.insert(m_out.end(), {kSetHigh, value, direction});
}

void MpsseQueue::readLow(uint8_t* dest)
{
    if (!ok()) return;
    emitTms();
    room(1, 1);
    m_out.push_back(kGetLow);
    expect(Kind::Raw, 1, ShiftSink::discard(), 0, dest);
}

void MpsseQueue::readHigh(uint8_t* dest)
{
    if (!ok()) return;
    emitTms();
    room(1, 1);
    m_out.push_back(kGetHigh);
    expect(Kind::Raw, 1, ShiftSink::discard(), 0, dest);
}

void MpsseQueue::raw(const std::vector<uint8_t>& bytes, std::size_t answerBytes, uint8_t* dest)
{
    if (!ok()) return;
    emitTms();
    room(bytes.size(), answerBytes);
    m_out.insert(m_out.end(), bytes.begin(), bytes.end());
    if (answerBytes > 0) expect(Kind::Raw, static_cast<uint32_t>(answerBytes), ShiftSink::discard(), 0, dest);
}

// ---- clock ---------------------------------------------------------------------------

uint16_t MpsseQueue::divisorFor(uint32_t hz, uint32_t baseHz)
{
    if (hz == 0) hz = 1;
    const uint64_t half = baseHz / 2;
    const uint64_t ratio = (half + hz - 1) / hz; // ceil: never faster than asked
    return static_cast<uint16_t>(std::min<uint64_t>(ratio == 0 ? 0 : ratio - 1, 0xFFFF));
}

uint32_t MpsseQueue::setFrequency(uint32_t hz)
{
    if (hz == 0) hz = 1;
    uint32_t base = kBase12;
    std::vector<uint8_t> bytes;
    if (m_highSpeed) {
        // Divide-by-5 off unless the request is below what 60 MHz can reach.
        base = hz * uint64_t{65536} * 2 > kBase60 ? kBase60 : kBase12;
        bytes = {base == kBase60 ? kDivBy5Off : kDivBy5On, kThreePhaseOff};
    }
    const uint16_t divisor = divisorFor(hz, base);
    bytes.insert(bytes.end(), {kDivisor, static_cast<uint8_t>(divisor & 0xFF), static_cast<uint8_t>(divisor >> 8)});
    raw(bytes);
    return static_cast<uint32_t>(base / (2u * (1u + divisor)));
}

void MpsseQueue::setAdaptive(bool on)
{
    raw({on ? kAdaptiveOn : kAdaptiveOff});
}

// ---- JTAG ------------------------------------------------------------------------------

void MpsseQueue::clockTms(bool tms, bool tdi)
{
    if (!ok()) return;
    if (m_tmsCount > 0 && tdi != m_tmsTdi) emitTms();
    m_tmsTdi = tdi;
    if (tms) m_tmsBits = static_cast<uint8_t>(m_tmsBits | (1u << m_tmsCount));
    ++m_tmsCount;
    m_tms = tms;
    m_tdi = tdi;
    if (m_tmsCount == 7) emitTms();
}

void MpsseQueue::holdClocks(uint64_t count, bool tms, bool tdi)
{
    if (!ok() || count == 0) return;
    if (!m_highSpeed || tms != m_tms) {
        for (uint64_t i = 0; i < count && ok(); ++i) clockTms(tms, tdi);
        return;
    }
    emitTms();
    driveTdi(tdi);
    for (uint64_t bytes = count / 8; bytes > 0;) {
        const uint64_t n = std::min<uint64_t>(bytes, 65536);
        room(3, 0);
        m_out.insert(m_out.end(), {kClockBytes, static_cast<uint8_t>((n - 1) & 0xFF), static_cast<uint8_t>((n - 1) >> 8)});
        bytes -= n;
    }
    if (const auto rest = static_cast<unsigned>(count % 8); rest > 0) {
        room(2, 0);
        m_out.insert(m_out.end(), {kClockBits, static_cast<uint8_t>(rest - 1)});
    }
}

void MpsseQueue::shift(const ShiftSource& in, const ShiftSink& out, uint64_t count, bool tmsOnLast,
                       uint64_t sinkOffset)
{
    if (!ok() || count == 0) return;
    emitTms();
    const bool read = out.wanted();
    const bool readOnly = read && in.isConstant();
    const uint64_t body = tmsOnLast ? count - 1 : count;
    if (readOnly && body > 0) driveTdi(in.bit(0)); // 0x28/0x2A leave TDI where it is

    uint64_t done = 0;
    for (uint64_t bytesLeft = body / 8; bytesLeft > 0;) {
        std::size_t n = static_cast<std::size_t>(std::min<uint64_t>(bytesLeft, kMaxBytesPerCommand));
        n = std::min(n, kMaxWrite - 8);
        if (read) n = std::min(n, m_window);
        room(3 + (readOnly ? 0 : n), read ? n : 0);
        const uint8_t opcode = readOnly ? kReadBytes : read ? kReadWriteBytes : kWriteBytes;
        m_out.insert(m_out.end(), {opcode, static_cast<uint8_t>((n - 1) & 0xFF), static_cast<uint8_t>((n - 1) >> 8)});
        if (!readOnly) {
            const std::size_t at = m_out.size();
            m_out.resize(at + n);
            uint8_t* p = m_out.data() + at;
            for (std::size_t i = 0; i < n; i += 8) {
                const unsigned chunk = static_cast<unsigned>(std::min<std::size_t>(8, n - i));
                const uint64_t word = in.word(done + 8 * i, chunk * 8);
                for (unsigned b = 0; b < chunk; ++b) p[i + b] = static_cast<uint8_t>(word >> (8 * b));
            }
        }
        if (read) expect(Kind::Bytes, static_cast<uint32_t>(n), out, sinkOffset + done, nullptr);
        done += 8 * uint64_t{n};
        bytesLeft -= n;
        if (!ok()) return;
    }
    if (const auto bits = static_cast<unsigned>(body - done); bits > 0) {
        room(3, read ? 1 : 0);
        const auto length = static_cast<uint8_t>(bits - 1);
        if (readOnly) {
            m_out.insert(m_out.end(), {kReadBits, length});
        } else {
            const auto data = static_cast<uint8_t>(in.word(done, bits));
            m_out.insert(m_out.end(), {read ? kReadWriteBits : kWriteBits, length, data});
        }
        if (read) expect(Kind::Bits, bits, out, sinkOffset + done, nullptr);
    }
    if (body > 0) m_tdi = in.bit(body - 1);
    if (tmsOnLast) {
        const bool last = in.bit(count - 1);
        room(3, read ? 1 : 0);
        m_out.insert(m_out.end(), {read ? kTmsRead : kTms, 0, static_cast<uint8_t>(0x01u | (last ? 0x80u : 0u))});
        if (read) expect(Kind::Bits, 1, out, sinkOffset + count - 1, nullptr);
        m_tms = true;
        m_tdi = last;
    }
}

// ---- transactions ------------------------------------------------------------------

void MpsseQueue::fail(const std::string& text)
{
    if (m_error.empty()) m_error = text.empty() ? std::string("USB transfer failed") : text;
    drop();
}

void MpsseQueue::drop()
{
    m_out.clear();
    m_answers.clear();
    m_answerBytes = 0;
    m_tmsCount = 0;
    m_tmsBits = 0;
}

void MpsseQueue::clearError()
{
    m_error.clear();
    drop();
}

bool MpsseQueue::flush()
{
    if (!ok()) return false;
    emitTms();
    return transact();
}

bool MpsseQueue::transact()
{
    if (!ok()) return false;
    if (m_out.empty()) return true;
    const std::size_t expected = m_answerBytes;
    if (expected > 0) m_out.push_back(kSendImmediate);
    std::string error;
    if (!m_link->write(m_out.data(), m_out.size(), error)) {
        fail(error);
        return false;
    }
    ++m_counters.writes;
    m_counters.bytesOut += m_out.size();
    m_out.clear();
    if (expected > 0) {
        m_in.resize(expected);
        if (!m_link->read(m_in.data(), expected, kReadTimeoutMs, error)) {
            fail(error);
            return false;
        }
        ++m_counters.reads;
        m_counters.bytesIn += expected;
        if (const std::size_t extra = m_link->pending(); extra > 0) {
            // More than the commands produce: the chip rejected one of them,
            // answering 0xFA and the opcode.  Find which.
            std::vector<uint8_t> all = m_in;
            all.resize(expected + extra);
            m_link->read(all.data() + expected, extra, kReadTimeoutMs, error);
            char text[96];
            std::snprintf(text, sizeof text, "the adapter sent %zu unexpected bytes", extra);
            for (std::size_t i = 0; i + 1 < all.size(); ++i)
                if (all[i] == kBadCommand && all[i + 1] >= 0x80) {
                    std::snprintf(text, sizeof text, "the adapter answered \"bad command\" to MPSSE command 0x%02X",
                                  all[i + 1]);
                    break;
                }
            fail(text);
            return false;
        }
        scatter();
    }
    m_answers.clear();
    m_answerBytes = 0;
    return true;
}

void MpsseQueue::scatter()
{
    const uint8_t* in = m_in.data();
    for (Answer& a : m_answers) {
        const uint8_t* p = in + a.at;
        switch (a.kind) {
        case Kind::Raw:
            std::copy(p, p + a.count, a.raw);
            break;
        case Kind::Bits:
            // Bit commands shift in at bit 7: n bits sit in bits 8-n..7.
            a.sink.put(a.offset, a.count, static_cast<uint64_t>(p[0] >> (8 - a.count)));
            break;
        case Kind::Bytes:
            for (uint32_t i = 0; i < a.count; i += 8) {
                const unsigned chunk = a.count - i < 8 ? a.count - i : 8;
                uint64_t word = 0;
                for (unsigned b = 0; b < chunk; ++b) word |= static_cast<uint64_t>(p[i + b]) << (8 * b);
                a.sink.put(a.offset + 8 * uint64_t{i}, chunk * 8, word);
            }
            break;
        }
    }
}

} // namespace jexusb
