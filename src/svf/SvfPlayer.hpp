// SPDX-License-Identifier: MIT
#pragma once
// SvfPlayer - runs SVF statements on a target, one at a time: each is read
// whole and checked before any of it reaches the cable, and play stops at
// the first error (at the first TDO mismatch too, unless told to keep
// going).  Without a target (a dry run) it checks the whole text, tracking
// the TAP state, sticky values and paths exactly as a real play would.
//
// The TAP is reset (TMS high) before the first statement.  Scans with
// header and trailer become one whole-chain shift of the composite vector.
// Warnings (and, when keeping going, each TDO mismatch) go to the session as
// "<name>:<line>: <text>"; what stopped play is kept in errorText().

#include <cstdint>
#include <string>

#include "jexjtag/svf.h"
#include "svf/SvfBits.hpp"
#include "svf/SvfScanRegister.hpp"
#include "svf/SvfStatement.hpp"

namespace JexRT {

class ITarget;
class Session;
class SvfInput;

class SvfPlayer {
public:
    struct Options {
        bool keepGoing = false;
        double maxHz = 0;
        JexJtagSvfProgress progress = nullptr;
        void* progressUser = nullptr;
    };
    // The first TDO mismatch: its line, the first differing bit, and the
    // compared vectors (SvfBits::hex prints them).
    struct Mismatch {
        uint64_t line = 0;
        uint64_t bit = 0;
        SvfBits expected, actual, mask;
    };

    // target null: a dry run.  session (may be null) receives the messages.
    SvfPlayer(Session* session, ITarget* target, unsigned handle, std::string name, const Options& options);

    // Plays the whole input; the outcome, with the details below.
    JexJtagSvfOutcome play(SvfInput& input);

    uint64_t statements() const { return m_statements; }
    uint64_t checks() const { return m_checks; }
    uint64_t mismatches() const { return m_mismatches; }
    const Mismatch& firstMismatch() const { return m_first; }
    uint64_t errorLine() const { return m_errorLine; }
    // "<name>:<line>: <text>": the error that stopped play, else the first
    // TDO mismatch; "" when the play passed.
    const std::string& errorText() const { return m_errorText; }

private:
    void run(SvfStatement& s);
    void scan(bool ir, const SvfStatement& s);
    void runTest(const SvfStatement& s);
    void state(const SvfStatement& s);
    void trst(const SvfStatement& s);
    void frequency(uint64_t line, double requested);
    void restoreFrequency();
    void moveTo(uint64_t line, unsigned stable);
    void check(unsigned status, uint64_t line, const char* what);
    void progress(uint64_t offset, bool force);
    void message(unsigned type, uint64_t line, const std::string& text);

    Session* m_session;
    ITarget* m_target;
    unsigned m_handle;
    std::string m_name;
    Options m_options;

    SvfScanRegister m_sir, m_sdr, m_hir, m_hdr, m_tir, m_tdr;
    unsigned m_state = 0; // JEXJTAG_TEST_LOGIC_RESET
    unsigned m_endIR = 1; // JEXJTAG_RUN_TEST_IDLE
    unsigned m_endDR = 1;
    unsigned m_runState = 1;
    unsigned m_runEnd = 1;
    bool m_trstAbsent = false;
    int m_trstLine = -1; // -1 not tried, 0 none, 1 works
    double m_fileHz = 0; // the file's FREQUENCY, 0 = none
    double m_cableHz = 0; // the cable's TCK now, 0 = unknown
    double m_originalHz = 0;
    bool m_frequencyChanged = false;

    SvfBits m_tdi, m_tdo, m_expected, m_mask, m_slice;

    uint64_t m_bytesTotal = 0;
    uint64_t m_lastReport = 0;
    uint64_t m_statements = 0;
    uint64_t m_checks = 0;
    uint64_t m_mismatches = 0;
    bool m_stop = false;
    Mismatch m_first;
    uint64_t m_errorLine = 0;
    uint64_t m_line = 0; // of the statement running
    std::string m_errorText;
    std::string m_firstText;
};

} // namespace JexRT
