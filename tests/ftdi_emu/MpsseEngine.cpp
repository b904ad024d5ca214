// SPDX-License-Identifier: MIT
#include "MpsseEngine.hpp"

#include <algorithm>
#include <cstring>

#include "jexjtag/cable/ShiftSink.hpp"
#include "jexjtag/cable/ShiftSource.hpp"

namespace ftdiemu {

namespace {

// Opcodes with bit 7 set that only the H chips know.
bool highSpeedOnly(uint8_t op)
{
    return (op >= 0x8A && op <= 0x8F) || op == 0x94 || op == 0x95 || op == 0x96 || op == 0x97 ||
           (op >= 0x9C && op <= 0x9E);
}

// Argument bytes of the commands with bit 7 set (-1: not a command).
int specialArguments(uint8_t op)
{
    switch (op) {
    case 0x80: case 0x82: case 0x86: case 0x8F: case 0x9C: case 0x9D: case 0x9E: return 2;
    case 0x8E: return 1;
    case 0x81: case 0x83: case 0x84: case 0x85: case 0x87: case 0x88: case 0x89: case 0x8A: case 0x8B: case 0x8C:
    case 0x8D: case 0x94: case 0x95: case 0x96: case 0x97: return 0;
    default: return -1;
    }
}

} // namespace

MpsseEngine::MpsseEngine(jexsim::SimChain& chain, bool highSpeed, std::size_t packetSize, std::size_t fifoSize,
                         std::set<uint8_t> rejected)
    : m_chain(&chain), m_highSpeed(highSpeed), m_packetSize(packetSize), m_fifoSize(fifoSize),
      m_rejected(std::move(rejected))
{
}

void MpsseEngine::setMpsse(bool on)
{
    m_mpsse = on;
    m_pendingCommand.clear();
    m_divideBy5 = true;
    m_adaptive = false;
    m_threePhase = false;
    m_loopback = false;
}

void MpsseEngine::purge()
{
    m_pendingCommand.clear();
    m_in.clear();
    m_releasable = 0;
}

uint32_t MpsseEngine::tckHz() const
{
    const uint32_t base = m_highSpeed && !m_divideBy5 ? 60000000u : 12000000u;
    return base / (2u * (1u + m_divisor));
}

uint16_t MpsseEngine::pins() const
{
    // Outputs show what is driven; inputs read high (pull-ups) except TDO.
    auto low = static_cast<uint8_t>((m_lowValue & m_lowDir) | (~m_lowDir & 0xFB));
    if (m_chain->tdo(tdiPin())) low |= 0x04;
    const auto high = static_cast<uint8_t>((m_highValue & m_highDir) | (~m_highDir & 0xFF));
    return static_cast<uint16_t>(high << 8 | low);
}

void MpsseEngine::answer(uint8_t byte)
{
    m_in.push_back(byte);
    m_lastAnswer = std::chrono::steady_clock::now();
}

bool MpsseEngine::clock(bool tms, bool tdi)
{
    const bool tdo = m_chain->clock(tms, tdi);
    return m_loopback ? tdi : tdo;
}

bool MpsseEngine::write(const uint8_t* data, std::size_t size)
{
    if (!m_mpsse) return true; // not in MPSSE mode: the bytes go to the UART, not to us
    m_pendingCommand.insert(m_pendingCommand.end(), data, data + size);
    std::size_t pos = 0;
    while (pos < m_pendingCommand.size()) {
        const std::size_t used = command(m_pendingCommand.data() + pos, m_pendingCommand.size() - pos);
        if (used == 0) break;
        pos += used;
    }
    m_pendingCommand.erase(m_pendingCommand.begin(), m_pendingCommand.begin() + static_cast<std::ptrdiff_t>(pos));
    return m_in.size() <= m_fifoSize;
}

std::size_t MpsseEngine::read(uint8_t* out, std::size_t capacity)
{
    const std::size_t payload = m_packetSize - 2;
    std::size_t due = m_releasable;
    due = std::max(due, m_in.size() / payload * payload);
    if (!m_in.empty() &&
        std::chrono::steady_clock::now() - m_lastAnswer >= std::chrono::milliseconds(m_latencyMs))
        due = m_in.size();
    std::size_t pos = 0;
    std::size_t sent = 0;
    while (capacity - pos >= 2) {
        out[pos++] = 0x32; // modem status: CTS, DSR
        out[pos++] = 0x60; // line status: transmitter empty
        const std::size_t take = std::min({payload, due - sent, capacity - pos});
        std::memcpy(out + pos, m_in.data() + sent, take);
        pos += take;
        sent += take;
        if (take < payload || sent == due) break; // a short packet ends the transfer
    }
    m_in.erase(m_in.begin(), m_in.begin() + static_cast<std::ptrdiff_t>(sent));
    m_releasable -= std::min(m_releasable, sent);
    return pos;
}

std::size_t MpsseEngine::command(const uint8_t* p, std::size_t n)
{
    const uint8_t op = p[0];
    if (op & 0x80) {
        const int args = specialArguments(op);
        if (args < 0 || m_rejected.count(op) || (!m_highSpeed && highSpeedOnly(op))) {
            answer(0xFA);
            answer(op);
            ++m_badCommands;
            return 1;
        }
        if (n < 1u + static_cast<unsigned>(args)) return 0;
        const uint16_t word = args == 2 ? static_cast<uint16_t>(p[1] | p[2] << 8) : 0;
        switch (op) {
        case 0x80: m_lowValue = p[1]; m_lowDir = p[2]; break;
        case 0x82: m_highValue = p[1]; m_highDir = p[2]; break;
        case 0x81: answer(static_cast<uint8_t>(pins() & 0xFF)); break;
        case 0x83: answer(static_cast<uint8_t>(pins() >> 8)); break;
        case 0x84: m_loopback = true; break;
        case 0x85: m_loopback = false; break;
        case 0x86: m_divisor = word; break;
        case 0x87: m_releasable = m_in.size(); break;
        case 0x8A: m_divideBy5 = false; break;
        case 0x8B: m_divideBy5 = true; break;
        case 0x8C: m_threePhase = true; break;
        case 0x8D: m_threePhase = false; break;
        case 0x8E: for (unsigned i = 0; i <= p[1]; ++i) clock(tmsPin(), tdiPin()); break;
        case 0x8F: for (uint32_t i = 0; i < (word + 1u) * 8u; ++i) clock(tmsPin(), tdiPin()); break;
        case 0x96: m_adaptive = true; break;
        case 0x97: m_adaptive = false; break;
        default: break; // waits on GPIOL1 and drive-zero: nothing to model
        }
        return 1u + static_cast<unsigned>(args);
    }
    // A shift command: bit 1 bits, bit 3 LSB first, bit 4 write, bit 5 read, bit 6 TMS.
    const bool tmsMode = (op & 0x40) != 0;
    const bool bitMode = (op & 0x02) != 0 || tmsMode;
    const bool write = (op & 0x10) != 0 || tmsMode;
    std::size_t need;
    std::size_t count;
    if (bitMode) {
        need = write ? 3 : 2;
        if (n < 2) return 0;
        count = p[1] + 1u;
    } else {
        if (n < 3) return 0;
        count = (p[1] | p[2] << 8) + 1u;
        need = 3 + (write ? count : 0);
    }
    if (n < need) return 0;
    shiftCommand(op, p + 1, count);
    return need;
}

void MpsseEngine::shiftCommand(uint8_t op, const uint8_t* args, std::size_t count)
{
    const bool lsb = (op & 0x08) != 0;
    const bool write = (op & 0x10) != 0;
    const bool read = (op & 0x20) != 0;
    if (op & 0x40) { // TMS: up to 7 bits of args[1], bit 7 is TDI held for the command
        const uint8_t data = args[1];
        const bool tdi = (data & 0x80) != 0;
        setTdi(tdi);
        uint8_t r = 0;
        for (std::size_t i = 0; i < count && i < 8; ++i) {
            const bool tms = ((data >> i) & 1u) != 0;
            const bool tdo = clock(tms, tdi);
            setTms(tms);
            r = static_cast<uint8_t>((r >> 1) | (tdo ? 0x80 : 0));
        }
        if (read) answer(r);
        return;
    }
    if (op & 0x02) { // 1-8 bits
        const uint8_t data = write ? args[1] : 0;
        uint8_t r = 0;
        for (std::size_t i = 0; i < count; ++i) {
            const bool bit = ((lsb ? data >> i : data >> (7 - i)) & 1u) != 0;
            const bool tdi = write ? bit : tdiPin();
            const bool tdo = clock(tmsPin(), tdi);
            if (write) setTdi(bit);
            r = lsb ? static_cast<uint8_t>((r >> 1) | (tdo ? 0x80 : 0)) : static_cast<uint8_t>((r << 1) | tdo);
        }
        if (read) answer(r);
        return;
    }
    // Whole bytes.
    const uint8_t* data = args + 2;
    std::vector<uint8_t> result(count, 0);
    if (lsb && !tmsPin() && !m_loopback) {
        const jexcable::ShiftSource in =
            write ? jexcable::ShiftSource::buffer(data) : jexcable::ShiftSource::level(tdiPin());
        jexcable::ShiftSink out = jexcable::ShiftSink::buffer(result.data());
        m_chain->shift(in, out, static_cast<uint32_t>(count * 8), false);
        if (write) setTdi((data[count - 1] & 0x80) != 0);
    } else {
        for (std::size_t b = 0; b < count; ++b)
            for (unsigned i = 0; i < 8; ++i) {
                const unsigned at = lsb ? i : 7 - i;
                const bool bit = write && ((data[b] >> at) & 1u) != 0;
                const bool tdo = clock(tmsPin(), write ? bit : tdiPin());
                if (write) setTdi(bit);
                if (tdo) result[b] = static_cast<uint8_t>(result[b] | (1u << at));
            }
    }
    if (read)
        for (uint8_t byte : result) answer(byte);
}

} // namespace ftdiemu
