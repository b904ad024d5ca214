// SPDX-License-Identifier: MIT
#include "SimChain.hpp"

#include "jexjtag/cable/PluginPlatform.hpp"

namespace jexsim {

SimChain::SimChain(const std::vector<DeviceSpec>& devices, const SimBoard* board) : m_board(board)
{
    m_devices.reserve(devices.size());
    for (const DeviceSpec& device : devices) m_devices.emplace_back(device);
    for (std::size_t k = 0; k < m_devices.size(); ++k) m_devices[k].attach(this, k);
}

void SimChain::resolveBoard() const
{
    const uint64_t version = m_board ? m_board->version : 0;
    if (version == m_boardVersion) return;
    m_boardVersion = version;
    m_netOf.clear();
    m_nets.clear();
    m_levels.clear();
    if (!m_board) return;
    std::vector<DeviceSpec> specs;
    for (const SimDevice& d : m_devices) specs.push_back(d.description());
    for (const SimBoard::Setting& s : m_board->levels) {
        const int pin = SimBoard::resolve(s.pin, specs);
        if (pin >= 0) m_levels[key(s.pin.device, pin)] = s.level;
    }
    for (const SimBoard::Wire& w : m_board->wires) {
        const int a = SimBoard::resolve(w.a, specs);
        const int b = SimBoard::resolve(w.b, specs);
        if (a < 0 || b < 0) continue;
        const uint64_t ka = key(w.a.device, a), kb = key(w.b.device, b);
        auto ia = m_netOf.find(ka), ib = m_netOf.find(kb);
        if (ia == m_netOf.end() && ib == m_netOf.end()) {
            m_netOf[ka] = m_netOf[kb] = m_nets.size();
            m_nets.push_back({{w.a.device, a}, {w.b.device, b}});
        } else if (ib == m_netOf.end()) {
            m_netOf[kb] = ia->second;
            m_nets[ia->second].emplace_back(w.b.device, b);
        } else if (ia == m_netOf.end()) {
            m_netOf[ka] = ib->second;
            m_nets[ib->second].emplace_back(w.a.device, a);
        } else if (ia->second != ib->second) { // two nets become one
            const std::size_t keep = ia->second, gone = ib->second;
            for (const auto& member : m_nets[gone]) {
                m_netOf[key(member.first, member.second)] = keep;
                m_nets[keep].push_back(member);
            }
            m_nets[gone].clear();
        }
    }
}

bool SimChain::pinLevel(std::size_t device, int pin) const
{
    resolveBoard();
    bool level = false;
    if (device < m_devices.size() && m_devices[device].drives(pin, level)) return level;
    const auto net = m_netOf.find(key(device, pin));
    if (net == m_netOf.end()) {
        const auto set = m_levels.find(key(device, pin));
        return set != m_levels.end() && set->second;
    }
    const auto& members = m_nets[net->second];
    for (const auto& [d, p] : members)
        if (m_devices[d].drives(p, level)) return level;
    for (const auto& [d, p] : members) {
        const auto set = m_levels.find(key(d, p));
        if (set != m_levels.end()) return set->second;
    }
    return false;
}

bool SimChain::clock(bool tms, bool tdi)
{
    const bool out = tdo(tdi);
    // Every device samples its neighbour's TDO as it was before this edge:
    // clock from TDO towards TDI, so the neighbour has not moved yet.
    const std::size_t n = m_devices.size();
    for (std::size_t k = 0; k < n; ++k) {
        const bool in = k + 1 < n ? m_devices[k + 1].tdo() : tdi;
        m_devices[k].clock(tms, in);
    }
    ++m_cycles;
    m_lastTms = tms;
    m_lastTdi = tdi;
    if (m_observer) {
        m_observer->onClock(*this, tms, tdi, out);
        m_observer->checkRecorded(false);
    }
    return out;
}

bool SimChain::inShiftState() const
{
    for (const SimDevice& d : m_devices)
        if (d.state() != JEXJTAG_SHIFT_DR && d.state() != JEXJTAG_SHIFT_IR) return false;
    return true;
}

void SimChain::moveTms(const uint8_t* tms, uint32_t count, bool tdi)
{
    for (uint32_t i = 0; i < count; ++i) clock(jexcable::BitBuffer::get(tms, i), tdi);
}

bool SimChain::drivePin(uint32_t pin, bool level)
{
    if (pin != JEXJTAG_TCK && pin != JEXJTAG_TMS && pin != JEXJTAG_TDI) return false;
    if (pin == JEXJTAG_TDI) m_lastTdi = level;
    if (m_observer) {
        m_observer->onPinLevel(*this, pin, level);
        m_observer->checkRecorded(false);
    }
    return true;
}

bool SimChain::readPin(uint32_t pin, bool& level)
{
    if (pin != JEXJTAG_TDO) return false;
    level = tdo(m_lastTdi);
    return true;
}

void SimChain::sleep(uint32_t microseconds)
{
    if (m_observer) {
        m_observer->onWait(microseconds);
        m_observer->checkRecorded(true);
    }
    jexcable::PluginPlatform::sleepMicroseconds(microseconds);
}

void SimChain::flush()
{
    if (m_observer) m_observer->checkRecorded(true);
}

void SimChain::shift(const jexcable::ShiftSource& in, const jexcable::ShiftSink& out, uint32_t count,
                     bool tmsOnLast)
{
    if (count == 0) return;
    if (m_observer || !inShiftState()) {
        for (uint32_t i = 0; i < count; ++i) out.putBit(i, clock(i + 1 == count && tmsOnLast, in.bit(i)));
        return;
    }
    const std::size_t n = m_devices.size();
    SimDevice* const devices = m_devices.data();
    uint64_t lastWord = 0;
    unsigned lastBits = 0;
    for (uint64_t done = 0; done < count;) {
        const unsigned bits = count - done >= 64 ? 64u : static_cast<unsigned>(count - done);
        uint64_t word = in.word(done, bits);
        lastWord = word;
        lastBits = bits;
        // The word enters at TDI (the last device) and leaves at device 0.
        for (std::size_t k = n; k-- > 0;) word = devices[k].shiftWord(word, bits);
        out.put(done, bits, word);
        done += bits;
    }
    if (tmsOnLast)
        for (std::size_t k = 0; k < n; ++k) devices[k].step(true);
    m_cycles += count;
    m_lastTms = tmsOnLast;
    m_lastTdi = ((lastWord >> (lastBits - 1)) & 1u) != 0;
}

} // namespace jexsim
