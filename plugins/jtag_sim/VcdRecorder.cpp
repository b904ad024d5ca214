// SPDX-License-Identifier: MIT
#include "VcdRecorder.hpp"

#include <cerrno>
#include <cstring>
#include <ctime>
#include <stdexcept>

#include "SimChain.hpp"
#include "jexjtag/cable/TapController.hpp"

namespace jexsim {

namespace {

constexpr const char* kPinIds[4] = {"!", "\"", "#", "$"};
constexpr const char* kPinNames[4] = {"tck", "tms", "tdi", "tdo"};
constexpr unsigned kTck = 0, kTms = 1, kTdi = 2, kTdo = 3;

// Identifier of the n-th device signal: printable characters from '%' on.
std::string identifier(std::size_t n)
{
    std::string id;
    do {
        id += static_cast<char>('%' + n % 90);
        n /= 90;
    } while (n > 0);
    return id;
}

uint64_t halfPeriodPs(uint64_t frequencyHz)
{
    if (frequencyHz == 0) frequencyHz = 1;
    const uint64_t half = 500000000000ull / frequencyHz;
    return half > 0 ? half : 1;
}

void binary(char (&text)[5], unsigned value)
{
    for (int i = 0; i < 4; ++i) text[i] = (value >> (3 - i)) & 1u ? '1' : '0';
    text[4] = '\0';
}

} // namespace

VcdRecorder::VcdRecorder(const std::string& path, const SimChain& chain, uint64_t frequencyHz, bool tdi)
    : m_path(path), m_halfPeriod(halfPeriodPs(frequencyHz))
{
    m_file = std::fopen(path.c_str(), "w");
    if (!m_file) throw std::runtime_error("cannot write the waveform file " + path);
    m_levels[kTdi] = tdi;
    m_levels[kTdo] = chain.tdo(tdi);

    char date[64] = "";
    const std::time_t t = std::time(nullptr);
    if (const std::tm* local = std::localtime(&t)) std::strftime(date, sizeof date, "%Y-%m-%d %H:%M:%S", local);
    std::fprintf(m_file, "$date %s $end\n$version JexJtag jtag_sim $end\n", date);
    std::fprintf(m_file, "$comment TAP states:");
    for (unsigned s = 0; s < JEXJTAG_STATE_SIZE; ++s) std::fprintf(m_file, " %u=%s", s, jexcable::TapController::name(s));
    std::fprintf(m_file, ". Device 0 is nearest TDO. $end\n$timescale 1ps $end\n$scope module jtag $end\n");
    for (unsigned p = 0; p < 4; ++p) std::fprintf(m_file, "$var wire 1 %s %s $end\n", kPinIds[p], kPinNames[p]);
    for (std::size_t d = 0; d < chain.size(); ++d) {
        m_stateIds.push_back(identifier(2 * d));
        m_nameIds.push_back(identifier(2 * d + 1));
        m_states.push_back(chain.device(d).state());
        std::fprintf(m_file, "$var reg 4 %s dev%zu_state $end\n", m_stateIds.back().c_str(), d);
        std::fprintf(m_file, "$var string 1 %s dev%zu_tap $end\n", m_nameIds.back().c_str(), d);
    }
    std::fprintf(m_file, "$upscope $end\n$enddefinitions $end\n#0\n$dumpvars\n");
    for (unsigned p = 0; p < 4; ++p) std::fprintf(m_file, "%d%s\n", m_levels[p] ? 1 : 0, kPinIds[p]);
    for (std::size_t d = 0; d < m_states.size(); ++d) {
        char bits[5];
        binary(bits, m_states[d]);
        std::fprintf(m_file, "b%s %s\n", bits, m_stateIds[d].c_str());
        std::fprintf(m_file, "s%s %s\n", jexcable::TapController::name(m_states[d]), m_nameIds[d].c_str());
    }
    std::fprintf(m_file, "$end\n");
    m_stamped = 0;
}

VcdRecorder::~VcdRecorder() { finish(); }

bool VcdRecorder::finish()
{
    if (!m_file) return true;
    // A last time stamp, so viewers show the final half cycle.
    std::fprintf(m_file, "#%llu\n", static_cast<unsigned long long>(m_time));
    const bool written = ok();
    const bool closed = std::fclose(m_file) == 0;
    m_file = nullptr;
    return written && closed;
}

bool VcdRecorder::ok() const { return m_file && !std::ferror(m_file); }

void VcdRecorder::checkRecorded(bool flushFirst)
{
    if (!m_file) return;
    if (flushFirst) {
        errno = 0;
        std::fflush(m_file);
    }
    if (!std::ferror(m_file)) return;
    const int error = errno;
    std::fclose(m_file);
    m_file = nullptr;
    throw std::runtime_error("writing the waveform to " + m_path + " failed (" +
                             (error ? std::strerror(error) : "write error") + "); recording stopped");
}

void VcdRecorder::stamp()
{
    if (m_stamped == m_time) return;
    std::fprintf(m_file, "#%llu\n", static_cast<unsigned long long>(m_time));
    m_stamped = m_time;
}

void VcdRecorder::change(unsigned signal, bool level)
{
    if (m_levels[signal] == level) return;
    m_levels[signal] = level;
    stamp();
    std::fprintf(m_file, "%d%s\n", level ? 1 : 0, kPinIds[signal]);
}

void VcdRecorder::changeState(std::size_t device, unsigned state)
{
    if (m_states[device] == state) return;
    m_states[device] = state;
    stamp();
    char bits[5];
    binary(bits, state);
    std::fprintf(m_file, "b%s %s\n", bits, m_stateIds[device].c_str());
    std::fprintf(m_file, "s%s %s\n", jexcable::TapController::name(state), m_nameIds[device].c_str());
}

void VcdRecorder::onClock(const SimChain& chain, bool tms, bool tdi, bool tdo)
{
    if (!m_file) return;
    change(kTck, false);
    change(kTms, tms);
    change(kTdi, tdi);
    change(kTdo, tdo);
    m_time += m_halfPeriod;
    change(kTck, true);
    for (std::size_t d = 0; d < m_states.size() && d < chain.size(); ++d) changeState(d, chain.device(d).state());
    m_time += m_halfPeriod;
}

void VcdRecorder::pinLevel(unsigned pin, bool level, const SimChain& chain)
{
    static const unsigned kSignalOfPin[4] = {kTdi, kTdo, kTms, kTck}; // JexJtagPin order
    if (pin >= 4 || !m_file) return;
    change(kSignalOfPin[pin], level);
    change(kTdo, chain.tdo(m_levels[kTdi]));
    m_time += m_halfPeriod;
}

void VcdRecorder::wait(uint64_t microseconds)
{
    m_time += microseconds * 1000000u;
}

void VcdRecorder::setFrequency(uint64_t frequencyHz)
{
    m_halfPeriod = halfPeriodPs(frequencyHz);
}

bool VcdRecorder::flush()
{
    return m_file && std::fflush(m_file) == 0 && ok();
}

} // namespace jexsim
