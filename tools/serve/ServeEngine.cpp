// SPDX-License-Identifier: MIT
#include "ServeEngine.hpp"

#include <cstdio>
#include <stdexcept>
#include <utility>

#include "TapStateTable.hpp"
#include "jexjtag/jexjtag.h"

namespace jexjtag::serve {

namespace {

constexpr uint64_t kMaxQueuedBits = uint64_t(1) << 24;
constexpr std::size_t kMaxQueuedOps = 4096;
constexpr std::size_t kMaxOwedReplies = std::size_t(1) << 20;
constexpr uint32_t kMaxRepeat = uint32_t(1) << 30; // clocks held by one navigation

void check(uint32_t status, const char* what)
{
    if (JEX_FAILED(status)) throw std::runtime_error(std::string("the target failed to ") + what);
}

std::string requestText(char c)
{
    char text[32];
    std::snprintf(text, sizeof text, "0x%02X", static_cast<unsigned char>(c));
    return (c > ' ' && c < 0x7F ? std::string("'") + c + "' (" + text + ")" : std::string(text));
}

} // namespace

ServeEngine::ServeEngine(unsigned handle, std::function<void(const std::string&)> notice)
    : m_handle(handle), m_notice(std::move(notice))
{
}

void ServeEngine::resetTap()
{
    m_ops.clear();
    m_owed.clear();
    m_queuedBits = 0;
    m_ahead = false;
    m_lastOp = -1;
    m_lastLevel = true;
    check(JexJtag_tap_navigate(m_handle, JEXJTAG_TEST_LOGIC_RESET, 5, 0), "reset the TAPs");
    m_state = JEXJTAG_TEST_LOGIC_RESET;
}

bool ServeEngine::feed(const char* data, std::size_t size)
{
    for (std::size_t i = 0; i < size; ++i) {
        const char c = data[i];
        if (m_sleepUs != 0 && c != 'Z' && c != 'z') sleepNow();
        if (c >= '0' && c <= '7') {
            write(static_cast<unsigned>(c - '0'));
        } else if (c == 'R') {
            read();
        } else if (c >= 'r' && c <= 'u') {
            resetLines(static_cast<unsigned>(c - 'r'));
        } else if (c == 'Z' || c == 'z') {
            m_sleepUs += c == 'Z' ? 1000 : 1;
        } else if (c == 'Q') {
            return false;
        } else if (c != 'B' && c != 'b') {
            throw std::runtime_error("unsupported request " + requestText(c) + " from the client");
        }
    }
    if (m_sleepUs != 0) sleepNow();
    return true;
}

bool ServeEngine::wantsSettle() const
{
    return m_queuedBits >= kMaxQueuedBits || m_ops.size() >= kMaxQueuedOps || m_owed.size() >= kMaxOwedReplies;
}

void ServeEngine::write(unsigned levels)
{
    const bool tck = (levels & 4) != 0;
    m_tms = (levels & 2) != 0;
    m_tdi = (levels & 1) != 0;
    if (tck && !m_tck) rising(m_tms, m_tdi);
    m_tck = tck;
}

void ServeEngine::read()
{
    // TDO shows the bit the last rising edge shifted out until TCK falls
    // (also for a bit shifted ahead: its edge is still to come).
    if (m_tck || m_ahead) {
        if (m_lastOp >= 0) m_ops[static_cast<std::size_t>(m_lastOp)].read = true;
        m_owed.push_back(m_lastOp >= 0 ? Reply{m_lastOp, m_lastBit} : Reply{-1, m_lastLevel ? 1u : 0u});
        return;
    }
    if (!TapStateTable::isShift(m_state)) {
        m_owed.push_back(Reply{-1, 1});
        return;
    }
    Op& op = openShift();
    op.read = true;
    m_owed.push_back(Reply{static_cast<int32_t>(m_ops.size() - 1), op.bits});
}

ServeEngine::Op& ServeEngine::openShift()
{
    const bool ir = m_state == JEXJTAG_SHIFT_IR;
    if (m_ops.empty() || !m_ops.back().shift || !m_ops.back().open || m_ops.back().ir != ir) {
        Op op;
        op.shift = true;
        op.ir = ir;
        m_ops.push_back(std::move(op));
    }
    return m_ops.back();
}

void ServeEngine::rising(bool tms, bool tdi)
{
    if (m_ahead) {
        m_ahead = false;
        if ((tms != m_aheadTms || tdi != m_aheadTdi) && !m_warnedLevels && m_notice) {
            m_warnedLevels = true;
            m_notice("the client changed TMS or TDI between reading TDO and the rising edge; the bit was "
                     "shifted with the levels it had at the read");
        }
        return;
    }
    if (TapStateTable::isShift(m_state)) {
        Op& op = openShift();
        if (op.bits % 8 == 0) op.tdi.push_back(0);
        if (tdi) op.tdi[op.bits / 8] = static_cast<uint8_t>(op.tdi[op.bits / 8] | (1u << (op.bits % 8)));
        m_lastOp = static_cast<int32_t>(m_ops.size() - 1);
        m_lastBit = op.bits++;
        ++m_queuedBits;
        if (tms) {
            op.open = false;
            op.to = TapStateTable::next(m_state, true);
            m_state = op.to;
        }
        return;
    }

    const unsigned next = TapStateTable::next(m_state, tms);
    m_lastOp = -1;
    m_lastLevel = true;
    Op* nav = (!m_ops.empty() && !m_ops.back().shift) ? &m_ops.back() : nullptr;
    if (nav && TapStateTable::holds(m_state, tms) && nav->repeat < kMaxRepeat) {
        ++nav->repeat;
    } else if (nav && nav->repeat == 0 && TapStateTable::distance(nav->from, next) == nav->length + 1 &&
               TapStateTable::hasUniqueShortestPath(nav->from, next)) {
        nav->to = next;
        ++nav->length;
    } else {
        Op op;
        op.from = m_state;
        op.to = next;
        op.length = next == m_state ? 0 : 1;
        op.repeat = next == m_state ? 1 : 0;
        m_ops.push_back(std::move(op));
    }
    m_state = next;
}

void ServeEngine::settle()
{
    // A read of a bit whose rising edge has not come yet: shift it now with
    // the levels driven at the read.
    if (!m_ops.empty() && m_ops.back().shift && m_ops.back().open && !m_owed.empty() &&
        m_owed.back().op == static_cast<int32_t>(m_ops.size() - 1) && m_owed.back().bit == m_ops.back().bits) {
        rising(m_tms, m_tdi);
        m_ahead = true;
        m_aheadTms = m_tms;
        m_aheadTdi = m_tdi;
    }
    try {
        run();
    } catch (...) {
        m_ops.clear();
        m_owed.clear();
        m_queuedBits = 0;
        m_lastOp = -1;
        throw;
    }
    for (const Reply& reply : m_owed) {
        bool level = reply.bit != 0;
        if (reply.op >= 0) {
            const Op& op = m_ops[static_cast<std::size_t>(reply.op)];
            level = (op.tdo[reply.bit / 8] >> (reply.bit % 8)) & 1u;
        }
        m_replies.push_back(level ? '1' : '0');
    }
    if (m_lastOp >= 0) {
        const Op& op = m_ops[static_cast<std::size_t>(m_lastOp)];
        m_lastLevel = op.read ? ((op.tdo[m_lastBit / 8] >> (m_lastBit % 8)) & 1u) != 0 : true;
        m_lastOp = -1;
    }
    m_owed.clear();
    m_queuedBits = 0;
    m_ops.clear();
}

void ServeEngine::run()
{
    for (Op& op : m_ops) {
        if (!op.shift) {
            if (op.length != 0 || op.repeat != 0)
                check(JexJtag_tap_navigate(m_handle, op.to, op.repeat, 0), "move the TAP");
            continue;
        }
        if (op.bits == 0) continue;
        const unsigned shiftState = op.ir ? JEXJTAG_SHIFT_IR : JEXJTAG_SHIFT_DR;
        const unsigned exitState = op.open ? shiftState : op.to;
        const unsigned mode = op.read ? JEXJTAG_SHIFT_READWRITE : JEXJTAG_SHIFT_WRITE;
        op.tdo.assign(op.read ? op.tdi.size() : 0, 0);
        const auto shift = op.ir ? JexJtag_tap_shiftChainIR : JexJtag_tap_shiftChainDR;
        check(shift(m_handle, mode, exitState, nullptr, op.bits, op.tdi.data(), op.read ? op.tdo.data() : nullptr,
                    nullptr, nullptr),
              op.ir ? "shift the instruction register" : "shift the data register");
    }
}

void ServeEngine::sleepNow()
{
    const uint64_t us = m_sleepUs;
    m_sleepUs = 0;
    settle();
    check(JexJtag_target_waitTime(m_handle, static_cast<unsigned>(us > 0xFFFFFFFFu ? 0xFFFFFFFFu : us)), "wait");
}

void ServeEngine::resetLines(unsigned lines)
{
    if (lines & 1u) {
        if (!m_warnedSrst && m_notice) {
            m_warnedSrst = true;
            m_notice("SRST requests are ignored: the target has no system reset line");
        }
    }
    if (lines & 2u) {
        settle();
        check(JexJtag_tap_navigate(m_handle, JEXJTAG_TEST_LOGIC_RESET, 5, 0), "reset the TAPs");
        m_state = JEXJTAG_TEST_LOGIC_RESET;
        m_lastLevel = true;
    }
}

bool ServeEngine::endClient()
{
    bool ok = true;
    m_owed.clear();
    try {
        settle();
    } catch (const std::exception&) {
        ok = false;
    }
    m_replies.clear();
    m_tck = m_tms = m_tdi = false;
    m_ahead = false;
    m_sleepUs = 0;
    return ok;
}

} // namespace jexjtag::serve
