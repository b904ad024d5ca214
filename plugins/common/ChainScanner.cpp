// SPDX-License-Identifier: MIT
#include "jexjtag/cable/ChainScanner.hpp"

#include <string>

namespace jexcable {

namespace {

constexpr uint32_t kEndOfChain = 0xFFFFFFFFu;
constexpr unsigned kChunk = 64;

} // namespace

bool ChainScanner::readBit()
{
    uint8_t bit = 0;
    m_engine->shiftLevel(JtagEngine::Register::Data, true, &bit, 1, JEXJTAG_SHIFT_DR);
    return bit & 1u;
}

bool ChainScanner::scanIdcodes(Result& result)
{
    m_engine->resetTap();
    m_engine->moveTo(JEXJTAG_SHIFT_DR);
    for (uint32_t n = 0; n <= m_limits.maxDevices; ++n) {
        if (!readBit()) {
            if (n == m_limits.maxDevices) break;
            result.devices.push_back({0, 0});
            result.hasIdcode.push_back(false);
            continue;
        }
        uint8_t rest[4] = {0, 0, 0, 0};
        m_engine->shiftLevel(JtagEngine::Register::Data, true, rest, 31, JEXJTAG_SHIFT_DR);
        const uint32_t tail = static_cast<uint32_t>(rest[0]) | static_cast<uint32_t>(rest[1]) << 8 |
                              static_cast<uint32_t>(rest[2]) << 16 | static_cast<uint32_t>(rest[3]) << 24;
        const uint32_t idcode = 1u | (tail << 1);
        if (idcode == kEndOfChain) return true;
        if (n == m_limits.maxDevices) break;
        result.devices.push_back({idcode, 0});
        result.hasIdcode.push_back(true);
    }
    result.error = "no end of the chain found within " + std::to_string(m_limits.maxDevices) +
                   " devices (is TDO stuck?)";
    return false;
}

bool ChainScanner::scanIr(Result& result)
{
    const uint32_t maxBits = m_limits.maxIrBits;
    // Twice the limit: an IR longer than the limit still holds captured
    // bits after the first half, and they show in the second.
    std::vector<uint8_t> captured(BitBuffer::bytesFor(2 * maxBits), 0);
    m_engine->shiftLevel(JtagEngine::Register::Instruction, false, captured.data(), 2 * maxBits, JEXJTAG_SHIFT_IR);
    bool overlong = false;
    for (uint32_t i = maxBits; i < 2 * maxBits && !overlong; ++i) overlong = BitBuffer::get(captured.data(), i);

    // The chain now holds zeros; feed ones until the first comes out.
    uint32_t length = 0;
    bool found = false;
    while (!found && length <= maxBits) {
        uint8_t chunk[kChunk / 8] = {};
        m_engine->shiftLevel(JtagEngine::Register::Instruction, true, chunk, kChunk, JEXJTAG_SHIFT_IR);
        for (unsigned i = 0; i < kChunk; ++i) {
            if (BitBuffer::get(chunk, i)) {
                found = true;
                length += i;
                break;
            }
        }
        if (!found) length += kChunk;
    }
    // All devices now hold ones in their IR: BYPASS after Update-IR.
    m_engine->moveTo(JEXJTAG_UPDATE_IR);
    if (overlong || !found || length > maxBits) {
        result.error = "the instruction registers are longer than " + std::to_string(maxBits) +
                       " bits, the most an interrogation reads";
        return false;
    }
    result.irCapture.resize(length);
    for (uint32_t i = 0; i < length; ++i) result.irCapture[i] = BitBuffer::get(captured.data(), i);
    return true;
}

bool ChainScanner::countBypass(uint32_t& count, std::string& error)
{
    m_engine->moveTo(JEXJTAG_SHIFT_DR);
    // BYPASS registers capture 0: the first 1 is the TDI level arriving.
    uint32_t zeros = 0;
    while (zeros <= m_limits.maxDevices) {
        uint8_t chunk[kChunk / 8] = {};
        m_engine->shiftLevel(JtagEngine::Register::Data, true, chunk, kChunk, JEXJTAG_SHIFT_DR);
        for (unsigned i = 0; i < kChunk; ++i) {
            if (BitBuffer::get(chunk, i)) {
                count = zeros + i;
                m_engine->moveTo(JEXJTAG_UPDATE_DR);
                return true;
            }
        }
        zeros += kChunk;
    }
    m_engine->moveTo(JEXJTAG_UPDATE_DR);
    error = "more than " + std::to_string(m_limits.maxDevices) + " BYPASS registers in the chain";
    return false;
}

bool ChainScanner::scan(Result& result)
{
    result = Result();
    bool ok = scanIdcodes(result) && scanIr(result);
    if (ok) {
        uint32_t bypassCount = 0;
        ok = countBypass(bypassCount, result.error);
        if (ok && bypassCount != result.devices.size()) {
            result.error = "a DR scan after reset shows " + std::to_string(result.devices.size()) +
                           " devices but " + std::to_string(bypassCount) + " BYPASS registers answer";
            ok = false;
        }
    }
    if (ok) {
        std::vector<uint32_t> lengths;
        ok = splitIr(result.irCapture, static_cast<uint32_t>(result.devices.size()), lengths, result.ambiguous,
                     result.error);
        for (std::size_t i = 0; ok && i < lengths.size(); ++i) result.devices[i].irLength = lengths[i];
    }
    m_engine->resetTap();
    if (!ok) {
        result.devices.clear();
        result.hasIdcode.clear();
    }
    return ok;
}

bool ChainScanner::splitIr(const std::vector<bool>& capture, uint32_t deviceCount, std::vector<uint32_t>& lengths,
                           bool& ambiguous, std::string& error)
{
    lengths.clear();
    ambiguous = false;
    const std::size_t total = capture.size();
    if (deviceCount == 0) {
        if (total == 0) return true;
        error = "no device answers, yet the IR scan shows " + std::to_string(total) + " bits";
        return false;
    }
    if (total < 2 * static_cast<std::size_t>(deviceCount)) {
        error = "the IR scan shows " + std::to_string(total) + " bits, too few for " +
                std::to_string(deviceCount) + " devices of at least 2 bits";
        return false;
    }
    std::vector<std::size_t> starts;
    for (std::size_t p = 0; p + 1 < total; ++p)
        if (capture[p] && !capture[p + 1]) starts.push_back(p);
    if (starts.empty() || starts[0] != 0) {
        error = "the IR bits nearest TDO do not capture binary 01";
        return false;
    }
    if (starts.size() < deviceCount) {
        error = "the IR capture pattern shows " + std::to_string(starts.size()) + " instruction registers for " +
                std::to_string(deviceCount) + " devices";
        return false;
    }
    std::vector<uint32_t> pieces;
    for (std::size_t i = 0; i < starts.size(); ++i) {
        const std::size_t end = i + 1 < starts.size() ? starts[i + 1] : total;
        pieces.push_back(static_cast<uint32_t>(end - starts[i]));
    }
    ambiguous = pieces.size() > deviceCount;
    while (pieces.size() > deviceCount) {
        std::size_t best = 0;
        for (std::size_t i = 1; i + 1 < pieces.size(); ++i)
            if (pieces[i] + pieces[i + 1] < pieces[best] + pieces[best + 1]) best = i;
        pieces[best] += pieces[best + 1];
        pieces.erase(pieces.begin() + static_cast<std::ptrdiff_t>(best) + 1);
    }
    lengths = std::move(pieces);
    return true;
}

} // namespace jexcable
