// SPDX-License-Identifier: MIT
#include "RbbTransport.hpp"

#include <algorithm>
#include <array>
#include <stdexcept>
#include <utility>

#include "jexjtag/types.h"

namespace jexrbb {

using jexcable::ShiftSink;
using jexcable::ShiftSource;

namespace {

constexpr std::size_t kSendChunk = std::size_t(1) << 20; // bytes queued before they go out
constexpr uint64_t kEncodeChunk = 1u << 14;              // bits encoded between queue checks
constexpr std::size_t kReceiveSize = std::size_t(1) << 16;

char low(bool tms, bool tdi) { return static_cast<char>('0' + (tms ? 2 : 0) + (tdi ? 1 : 0)); }
char high(bool tms, bool tdi) { return static_cast<char>('4' + (tms ? 2 : 0) + (tdi ? 1 : 0)); }

// The requests for eight TMS-low clocks with the TDI bits of one byte
// (bit 0 first): with a read of each ("0R4" or "1R5" per bit) and without.
struct ByteTables {
    std::array<std::array<char, 24>, 256> read{};
    std::array<std::array<char, 16>, 256> write{};
    ByteTables()
    {
        for (unsigned b = 0; b < 256; ++b)
            for (unsigned i = 0; i < 8; ++i) {
                const bool tdi = (b >> i) & 1u;
                read[b][3 * i] = low(false, tdi);
                read[b][3 * i + 1] = 'R';
                read[b][3 * i + 2] = high(false, tdi);
                write[b][2 * i] = low(false, tdi);
                write[b][2 * i + 1] = high(false, tdi);
            }
    }
};

const ByteTables& tables()
{
    static const ByteTables t;
    return t;
}

} // namespace

RbbTransport::~RbbTransport() { detach(); }

void RbbTransport::attach(RbbSocket socket)
{
    detach();
    m_socket = std::move(socket);
    m_peer = m_socket.peer();
}

void RbbTransport::detach()
{
    // Replies still owed have no place to go any more.
    m_reads.clear();
    m_readIndex = 0;
    m_readDone = 0;
    m_unanswered = 0;
    if (m_socket.isOpen()) {
        try {
            m_out.push_back('Q'); // after whatever is still queued
            pump(UINT64_MAX);
        } catch (const std::exception&) {
            // the server has gone already
        }
    }
    m_socket.close();
    m_out.clear();
}

void RbbTransport::broken(const std::string& text)
{
    m_socket.close(); // part of the queue may have gone out: no 'Q' after it
    detach();
    throw std::runtime_error(text);
}

void RbbTransport::requireConnection()
{
    if (!m_socket.isOpen())
        throw std::runtime_error("the connection to " + m_peer +
                                 " was closed after an earlier failure; open the target again");
}

void RbbTransport::clockBit(bool tms, bool tdi, bool read)
{
    m_out.push_back(low(tms, tdi));
    if (read) m_out.push_back('R');
    m_out.push_back(high(tms, tdi));
}

void RbbTransport::addReads(const ShiftSink& sink, uint64_t offset, uint64_t count)
{
    m_unanswered += count;
    if (!m_reads.empty()) {
        ReadRun& last = m_reads.back();
        if (last.sink.bits() == sink.bits() && last.sink.mask() == sink.mask() &&
            last.offset + last.count == offset) {
            last.count += count;
            return;
        }
    }
    m_reads.push_back(ReadRun{sink, offset, count});
}

void RbbTransport::makeRoom()
{
    // Half the reads stay in flight, so the server never waits for us.
    if (m_unanswered >= kMaxUnanswered) pump(kMaxUnanswered / 2);
    else if (m_out.size() >= kSendChunk) pump(m_unanswered);
}

void RbbTransport::moveTms(const uint8_t* tms, uint32_t count, bool tdi)
{
    requireConnection();
    for (uint32_t i = 0; i < count; ++i) {
        if (i % kEncodeChunk == 0) makeRoom();
        clockBit((tms[i / 8] >> (i % 8)) & 1u, tdi, false);
    }
}

void RbbTransport::idleClocks(uint64_t count, bool tms, bool tdi)
{
    requireConnection();
    for (uint64_t i = 0; i < count; ++i) {
        if (i % kEncodeChunk == 0) makeRoom();
        clockBit(tms, tdi, false);
    }
}

void RbbTransport::shift(const ShiftSource& in, const ShiftSink& out, uint32_t count, bool tmsOnLast)
{
    if (count == 0) return;
    requireConnection();
    const bool read = out.wanted();
    const ByteTables& t = tables();
    const uint64_t body = count - 1; // the clocks with TMS low
    for (uint64_t done = 0; done < body;) {
        makeRoom();
        const uint64_t chunk = std::min<uint64_t>(body - done, kEncodeChunk);
        if (read) addReads(out, done, chunk);
        uint64_t j = 0;
        for (; j + 8 <= chunk; j += 8) {
            const auto byte = static_cast<uint8_t>(in.word(done + j, 8));
            if (read) m_out.append(t.read[byte].data(), t.read[byte].size());
            else m_out.append(t.write[byte].data(), t.write[byte].size());
        }
        for (; j < chunk; ++j) clockBit(false, in.bit(done + j), read);
        done += chunk;
    }
    makeRoom();
    if (read) addReads(out, body, 1);
    clockBit(tmsOnLast, in.bit(body), read);
}

void RbbTransport::flush()
{
    if (m_out.empty() && m_unanswered == 0) return;
    requireConnection();
    pump(0);
}

bool RbbTransport::readPin(uint32_t pin, bool& level)
{
    if (pin != JEXJTAG_TDO) return false;
    requireConnection();
    makeRoom();
    m_pinBits = 0;
    addReads(ShiftSink::buffer(&m_pinBits), 0, 1);
    m_out.push_back('R');
    pump(0);
    level = (m_pinBits & 1u) != 0;
    return true;
}

void RbbTransport::setResetLines(bool trst, bool srst)
{
    requireConnection();
    m_out.push_back(static_cast<char>('r' + (trst ? 2 : 0) + (srst ? 1 : 0)));
    pump(UINT64_MAX);
}

void RbbTransport::sleep(uint32_t microseconds)
{
    if (!m_remoteSleep) {
        JtagTransport::sleep(microseconds);
        return;
    }
    requireConnection();
    makeRoom();
    m_out.append(microseconds / 1000, 'Z');
    m_out.append(microseconds % 1000, 'z');
    pump(UINT64_MAX);
}

void RbbTransport::pump(uint64_t maxUnanswered)
{
    m_in.resize(kReceiveSize);
    std::size_t sent = 0;
    try {
        for (;;) {
            bool progress = false;
            if (const std::size_t n = m_socket.receiveSome(m_in.data(), m_in.size())) {
                takeReplies(m_in.data(), n);
                progress = true;
            }
            if (sent < m_out.size()) {
                const std::size_t n = m_socket.sendSome(m_out.data() + sent, m_out.size() - sent);
                sent += n;
                progress = progress || n > 0;
            }
            const bool sending = sent < m_out.size();
            if (!sending && m_unanswered <= maxUnanswered) break;
            if (!progress) m_socket.wait(sending, m_timeoutMs);
        }
    } catch (const std::runtime_error& e) {
        broken(e.what());
    }
    m_out.clear();
}

void RbbTransport::takeReplies(const char* data, std::size_t size)
{
    while (size > 0) {
        if (m_readIndex >= m_reads.size())
            throw std::runtime_error("the server at " + m_peer + " sent a byte nobody asked for");
        ReadRun& run = m_reads[m_readIndex];
        const uint64_t n = std::min<uint64_t>(size, run.count - m_readDone);
        for (uint64_t j = 0; j < n; j += 64) {
            const unsigned bits = static_cast<unsigned>(std::min<uint64_t>(64, n - j));
            uint64_t word = 0;
            for (unsigned k = 0; k < bits; ++k) {
                const char c = data[j + k];
                if (c == '1') word |= uint64_t(1) << k;
                else if (c != '0')
                    throw std::runtime_error("the server at " + m_peer + " answered a read with byte " +
                                             std::to_string(static_cast<unsigned char>(c)) +
                                             " instead of '0' or '1'");
            }
            run.sink.put(run.offset + m_readDone + j, bits, word);
        }
        data += n;
        size -= static_cast<std::size_t>(n);
        m_readDone += n;
        m_unanswered -= n;
        if (m_readDone == run.count) {
            ++m_readIndex;
            m_readDone = 0;
        }
    }
    if (m_readIndex == m_reads.size()) {
        m_reads.clear();
        m_readIndex = 0;
    }
}

} // namespace jexrbb
