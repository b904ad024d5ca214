// SPDX-License-Identifier: MIT
#include "svf/SvfPlayer.hpp"

#include <algorithm>
#include <chrono>
#include <cmath>
#include <cstdlib>
#include <memory>
#include <new>
#include <utility>

#include "session/Session.hpp"
#include "svf/SvfError.hpp"
#include "svf/SvfInput.hpp"
#include "svf/SvfLexer.hpp"
#include "svf/SvfParser.hpp"
#include "svf/SvfStates.hpp"
#include "target/ITarget.hpp"

namespace JexRT {

namespace {

using Kind = SvfStatement::Kind;

constexpr uint64_t kReportEvery = 256 * 1024;
constexpr unsigned kResetClocks = 5;

std::string hzText(double hz)
{
    char text[64];
    std::snprintf(text, sizeof text, "%.0f", hz);
    return text;
}

} // namespace

SvfPlayer::SvfPlayer(Session* session, ITarget* target, unsigned handle, std::string name, const Options& options)
    : m_session(session), m_target(target), m_handle(handle), m_name(std::move(name)), m_options(options)
{
    m_state = JEXJTAG_TEST_LOGIC_RESET;
    m_endIR = m_endDR = m_runState = m_runEnd = JEXJTAG_RUN_TEST_IDLE;
}

void SvfPlayer::message(unsigned type, uint64_t line, const std::string& text)
{
    if (!m_session) return;
    std::string full = m_name;
    if (line) full += ":" + std::to_string(line);
    m_session->sendMessage(type, full + ": " + text);
}

void SvfPlayer::check(unsigned status, uint64_t line, const char* what)
{
    if (JEX_FAILED(status)) throw SvfError(SvfError::Kind::Cable, line, std::string("the cable failed ") + what);
}

void SvfPlayer::progress(uint64_t offset, bool force)
{
    if (!m_options.progress) return;
    if (!force && offset - m_lastReport < kReportEvery && offset != m_bytesTotal) return;
    m_lastReport = offset;
    if (m_options.progress(m_options.progressUser, offset, m_bytesTotal, m_statements) != 0)
        throw SvfError(SvfError::Kind::Cancelled, 0, "cancelled by the host");
}

JexJtagSvfOutcome SvfPlayer::play(SvfInput& input)
{
    JexJtagSvfOutcome outcome = JEXJTAG_SVF_PASSED;
    m_bytesTotal = input.size();
    try {
        SvfLexer lexer(input);
        lexer.setChunkHook([this](uint64_t offset) { progress(offset, false); });
        SvfParser parser(lexer);
        auto statement = std::make_unique<SvfStatement>();
        progress(0, true);
        if (m_target) {
            JexJtagTargetInfo info{};
            if (!JEX_FAILED(m_target->getInfo(&info))) {
                info.frequency[sizeof info.frequency - 1] = '\0';
                char* end = nullptr;
                const double hz = std::strtod(info.frequency, &end);
                if (end != info.frequency && hz > 0) m_cableHz = m_originalHz = hz;
            }
            if (m_options.maxHz > 0) frequency(0, -1);
            check(m_target->navigate(JEXJTAG_TEST_LOGIC_RESET, kResetClocks, 0), 0, "to reset the TAP");
        }
        m_state = JEXJTAG_TEST_LOGIC_RESET;
        while (!m_stop && parser.read(*statement)) {
            m_line = statement->line;
            run(*statement);
            ++m_statements;
        }
        if (m_target) check(m_target->flush(), 0, "to flush");
        restoreFrequency();
        progress(lexer.offset(), true);
        if (m_mismatches) {
            outcome = JEXJTAG_SVF_MISMATCH;
            m_errorText = m_firstText;
        }
    } catch (const std::bad_alloc&) {
        outcome = JEXJTAG_SVF_BAD_FILE;
        m_errorLine = m_line;
        m_errorText = m_name + ":" + std::to_string(m_line) + ": out of memory for the vectors of this statement";
    } catch (const SvfError& e) {
        try {
            restoreFrequency();
        } catch (const SvfError&) {
        }
        switch (e.kind()) {
        case SvfError::Kind::BadFile: outcome = JEXJTAG_SVF_BAD_FILE; break;
        case SvfError::Kind::Cable: outcome = JEXJTAG_SVF_CABLE; break;
        case SvfError::Kind::Cancelled: outcome = JEXJTAG_SVF_CANCELLED; break;
        }
        m_errorLine = e.line();
        m_errorText = m_name + (e.line() ? ":" + std::to_string(e.line()) : std::string()) + ": " + e.what();
    }
    return outcome;
}

void SvfPlayer::run(SvfStatement& s)
{
    switch (s.kind) {
    case Kind::EndDR: m_endDR = s.states[0]; break;
    case Kind::EndIR: m_endIR = s.states[0]; break;
    case Kind::Frequency:
        m_fileHz = s.hz > 0 ? s.hz : 0;
        if (m_target) frequency(s.line, s.hz);
        break;
    case Kind::HDR: m_hdr.apply(s, "HDR"); break;
    case Kind::HIR: m_hir.apply(s, "HIR"); break;
    case Kind::TDR: m_tdr.apply(s, "TDR"); break;
    case Kind::TIR: m_tir.apply(s, "TIR"); break;
    case Kind::SDR:
        m_sdr.apply(s, "SDR");
        scan(false, s);
        break;
    case Kind::SIR:
        m_sir.apply(s, "SIR");
        scan(true, s);
        break;
    case Kind::RunTest: runTest(s); break;
    case Kind::State: state(s); break;
    case Kind::Trst: trst(s); break;
    }
}

void SvfPlayer::scan(bool ir, const SvfStatement& s)
{
    const SvfScanRegister& head = ir ? m_hir : m_hdr;
    const SvfScanRegister& body = ir ? m_sir : m_sdr;
    const SvfScanRegister& tail = ir ? m_tir : m_tdr;
    const unsigned endState = ir ? m_endIR : m_endDR;
    const uint64_t h = head.length();
    const uint64_t l = body.length();
    const uint64_t total = h + l + tail.length();
    if (total > UINT32_MAX)
        throw SvfError(SvfError::Kind::BadFile, s.line, "scan of " + std::to_string(total) + " bits is too long");
    const bool framed = head.hasTdo() || tail.hasTdo();
    const bool compare = body.hasTdo() || framed;
    if (!m_target) {
        m_state = endState;
        return;
    }
    const auto bits = static_cast<uint32_t>(total);
    const uint8_t* tdi = body.tdi().data();
    if (h != 0 || tail.length() != 0) {
        m_tdi.assignZeros(bits);
        m_tdi.orBits(0, head.tdi().data(), head.length());
        m_tdi.orBits(h, body.tdi().data(), body.length());
        m_tdi.orBits(h + l, tail.tdi().data(), tail.length());
        tdi = m_tdi.data();
    }
    if (compare) m_tdo.assignZeros(bits);
    if (bits == 0) {
        check(m_target->navigate(endState, 0, 0), s.line, "to move the TAP");
    } else {
        JexJtagCallContext context{m_handle, 0, nullptr};
        const unsigned mode = compare ? JEXJTAG_SHIFT_READWRITE : JEXJTAG_SHIFT_WRITE;
        uint8_t* tdo = compare ? m_tdo.data() : nullptr;
        const unsigned status =
            ir ? m_target->shiftChainIR(tdi, tdo, bits, nullptr, nullptr, mode, endState, &context)
               : m_target->shiftChainDR(tdi, tdo, bits, nullptr, nullptr, mode, endState, &context);
        check(status, s.line, ir ? "the IR scan" : "the DR scan");
    }
    m_state = endState;
    if (!compare) return;

    // Expected, actual and mask over the compared span: the statement's own
    // bits, or the whole composite when a header or trailer gave a TDO.
    const uint8_t *a, *e, *m;
    uint32_t span;
    if (!framed) {
        span = body.length();
        e = body.tdo().data();
        m = body.mask().data();
        if (h % 8 == 0) {
            a = m_tdo.data() + h / 8;
        } else {
            m_slice.assignSlice(m_tdo.data(), h, span);
            a = m_slice.data();
        }
    } else {
        span = bits;
        m_expected.assignZeros(bits);
        m_mask.assignZeros(bits);
        const SvfScanRegister* parts[3] = {&head, &body, &tail};
        uint64_t at = 0;
        for (const SvfScanRegister* part : parts) {
            if (part->hasTdo()) {
                m_expected.orBits(at, part->tdo().data(), part->length());
                m_mask.orBits(at, part->mask().data(), part->length());
            }
            at += part->length();
        }
        a = m_tdo.data();
        e = m_expected.data();
        m = m_mask.data();
    }
    ++m_checks;
    const int64_t bad = SvfBits::firstMismatch(a, e, m, span);
    if (bad < 0) return;
    ++m_mismatches;
    Mismatch found;
    found.line = s.line;
    found.bit = static_cast<uint64_t>(bad);
    found.expected.assignSlice(e, 0, span);
    found.actual.assignSlice(a, 0, span);
    found.mask.assignSlice(m, 0, span);
    // The message shows at most 64 digits of each, around the first difference.
    const std::string text = "TDO mismatch: expected " + found.expected.hex(64, found.bit) + " got " +
                             found.actual.hex(64, found.bit) + " mask " + found.mask.hex(64, found.bit) +
                             " (first at bit " + std::to_string(bad) + ")";
    if (m_mismatches == 1) {
        m_first = std::move(found);
        m_firstText = m_name + ":" + std::to_string(s.line) + ": " + text;
    }
    if (m_options.keepGoing) message(JEX_MSG_WARNING, s.line, text);
    else m_stop = true;
}

void SvfPlayer::moveTo(uint64_t line, unsigned stable)
{
    if (m_target) {
        if (stable == JEXJTAG_TEST_LOGIC_RESET) {
            // Whatever the state really is: TMS high at least five times.
            check(m_target->navigate(JEXJTAG_TEST_LOGIC_RESET, kResetClocks, 0), line, "to reset the TAP");
        } else if (stable == m_state) {
            // A Pause to itself goes round through Update and Capture.
            for (unsigned step : SvfStates::defaultPath(m_state, stable))
                check(m_target->navigate(step, 0, 0), line, "to move the TAP");
        } else {
            check(m_target->navigate(stable, 0, 0), line, "to move the TAP");
        }
    }
    m_state = stable;
}

void SvfPlayer::state(const SvfStatement& s)
{
    if (s.states.size() == 1) {
        moveTo(s.line, s.states[0]);
        return;
    }
    unsigned at = m_state;
    for (unsigned next : s.states) {
        if (!SvfStates::step(at, next, nullptr))
            throw SvfError(SvfError::Kind::BadFile, s.line,
                           std::string("STATE path: ") + SvfStates::name(next) + " does not follow " +
                               SvfStates::name(at));
        at = next;
    }
    at = m_state;
    for (unsigned next : s.states) {
        if (m_target) check(m_target->navigate(next, next == at ? 1 : 0, 0), s.line, "to move the TAP");
        at = next;
    }
    m_state = at;
}

void SvfPlayer::runTest(const SvfStatement& s)
{
    const unsigned run = s.runState >= 0 ? static_cast<unsigned>(s.runState) : m_runState;
    const unsigned end =
        s.endState >= 0 ? static_cast<unsigned>(s.endState) : (s.runState >= 0 ? static_cast<unsigned>(s.runState) : m_runEnd);
    m_runState = run;
    m_runEnd = end;
    if (!m_target) {
        m_state = end;
        return;
    }
    if (m_state != run) moveTo(s.line, run);
    double hz = m_cableHz > 0 ? m_cableHz : m_fileHz;
    if (m_options.maxHz > 0 && (hz <= 0 || m_options.maxHz < hz)) hz = m_options.maxHz;
    uint64_t clocks = s.hasCount ? s.runCount : 0;
    if (s.minTime > 0 && hz > 0) clocks = std::max<uint64_t>(clocks, static_cast<uint64_t>(std::ceil(std::min(s.minTime * hz, 4e9))));
    const auto start = std::chrono::steady_clock::now();
    while (clocks > 0) {
        const auto n = static_cast<unsigned>(std::min<uint64_t>(clocks, UINT32_MAX));
        check(m_target->navigate(run, n, 0), s.line, "to clock in the run state");
        clocks -= n;
    }
    if (s.minTime > 0) {
        check(m_target->flush(), s.line, "to flush");
        const double elapsed = std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
        double remaining = (s.minTime - elapsed) * 1e6;
        while (remaining >= 1) {
            const auto us = static_cast<unsigned>(std::min(std::ceil(remaining), 4e9));
            check(m_target->waitTime(us), s.line, "to wait");
            remaining -= us;
        }
    }
    m_state = run;
    if (end != run) moveTo(s.line, end);
}

void SvfPlayer::trst(const SvfStatement& s)
{
    using Mode = SvfStatement::TrstMode;
    if (m_trstAbsent) throw SvfError(SvfError::Kind::BadFile, s.line, "TRST after TRST ABSENT");
    if (s.trst == Mode::Absent) {
        m_trstAbsent = true;
        return;
    }
    if (m_target && m_trstLine != 0) {
        // The cable SDK's reset-line option: 1 asserts TRST*, 0 releases it
        // (a released line is as good as a floating one here).
        const char* value = s.trst == Mode::On ? "1" : "0";
        if (!JEX_FAILED(m_target->setOption("trst", value))) {
            m_trstLine = 1;
        } else {
            m_trstLine = 0;
            message(JEX_MSG_WARNING, s.line,
                    "the cable has no TRST line: TRST statements are left out, TRST ON resets the TAP with TMS");
        }
    }
    if (s.trst == Mode::On) moveTo(s.line, JEXJTAG_TEST_LOGIC_RESET);
}

void SvfPlayer::frequency(uint64_t line, double requested)
{
    double limit = requested > 0 ? requested : 0;
    if (m_options.maxHz > 0 && (limit <= 0 || m_options.maxHz < limit)) limit = m_options.maxHz;
    if (requested > 0 && m_originalHz > 0 && requested > m_originalHz)
        message(JEX_MSG_WARNING, line,
                "FREQUENCY " + hzText(requested) + " Hz is above the cable's " + hzText(m_originalHz) +
                    " Hz: TCK runs at " + hzText(std::min(m_cableHz, limit > 0 ? limit : m_cableHz)) + " Hz");
    double wanted = limit > 0 ? std::max(1.0, std::floor(limit)) : m_originalHz;
    if (m_originalHz > 0 && wanted > m_originalHz) wanted = m_originalHz;
    if (wanted <= 0 || wanted == m_cableHz) return;
    if (!JEX_FAILED(m_target->setOption("frequency", hzText(wanted)))) {
        m_cableHz = wanted;
        m_frequencyChanged = wanted != m_originalHz;
    } else {
        message(JEX_MSG_WARNING, line, "the cable's TCK frequency cannot be set to " + hzText(wanted) + " Hz");
    }
}

void SvfPlayer::restoreFrequency()
{
    if (!m_target || !m_frequencyChanged || m_originalHz <= 0) return;
    m_frequencyChanged = false;
    if (JEX_FAILED(m_target->setOption("frequency", hzText(m_originalHz))))
        message(JEX_MSG_WARNING, 0, "the cable's TCK frequency could not be put back to " + hzText(m_originalHz) + " Hz");
    else
        m_cableHz = m_originalHz;
}

} // namespace JexRT
