// SPDX-License-Identifier: MIT
#include "svf/SvfParser.hpp"

#include <cmath>
#include <cstdlib>
#include <string>

#include "svf/SvfLexer.hpp"
#include "svf/SvfStates.hpp"

namespace JexRT {

namespace {

using Kind = SvfStatement::Kind;

struct Command {
    const char* word;
    Kind kind;
};

const Command kCommands[] = {
    {"ENDDR", Kind::EndDR}, {"ENDIR", Kind::EndIR}, {"FREQUENCY", Kind::Frequency}, {"HDR", Kind::HDR},
    {"HIR", Kind::HIR},     {"TDR", Kind::TDR},     {"TIR", Kind::TIR},             {"SDR", Kind::SDR},
    {"SIR", Kind::SIR},     {"RUNTEST", Kind::RunTest}, {"STATE", Kind::State},     {"TRST", Kind::Trst},
};

const char* const kParamNames[4] = {"TDI", "TDO", "MASK", "SMASK"};

bool isNumberStart(const std::string& word)
{
    return !word.empty() && ((word[0] >= '0' && word[0] <= '9') || word[0] == '.');
}

// digits [. digits] [E [+|-] digits], at least one mantissa digit.
bool isReal(const std::string& w)
{
    size_t i = 0;
    size_t mantissa = 0;
    while (i < w.size() && w[i] >= '0' && w[i] <= '9') ++i, ++mantissa;
    if (i < w.size() && w[i] == '.') {
        ++i;
        while (i < w.size() && w[i] >= '0' && w[i] <= '9') ++i, ++mantissa;
    }
    if (mantissa == 0) return false;
    if (i < w.size() && w[i] == 'E') {
        ++i;
        if (i < w.size() && (w[i] == '+' || w[i] == '-')) ++i;
        size_t exponent = 0;
        while (i < w.size() && w[i] >= '0' && w[i] <= '9') ++i, ++exponent;
        if (exponent == 0) return false;
    }
    return i == w.size();
}

} // namespace

void SvfParser::expectWord(const char* what)
{
    if (m_lexer->next() != SvfLexer::Token::Word) m_lexer->fail(std::string("expected ") + what);
}

void SvfParser::expectSemicolon(const char* after)
{
    const SvfLexer::Token t = m_lexer->next();
    if (t == SvfLexer::Token::Semicolon) return;
    if (t == SvfLexer::Token::End) m_lexer->fail("statement without ';' at the end of the file");
    if (t == SvfLexer::Token::Word) m_lexer->fail("unexpected '" + m_lexer->word() + "' after " + after);
    m_lexer->fail(std::string("expected ';' after ") + after);
}

uint32_t SvfParser::integer(const char* what) { return integer(what, m_lexer->word()); }

uint32_t SvfParser::integer(const char* what, const std::string& w)
{
    uint64_t value = 0;
    bool ok = !w.empty() && w.size() <= 10;
    for (char c : w) {
        if (c < '0' || c > '9') ok = false;
        else value = value * 10 + static_cast<unsigned>(c - '0');
    }
    if (!ok || value > UINT32_MAX) m_lexer->fail(std::string(what) + " '" + w + "' is not a decimal number up to 4294967295");
    return static_cast<uint32_t>(value);
}

double SvfParser::real(const char* what) { return real(what, m_lexer->word()); }

double SvfParser::real(const char* what, const std::string& w)
{
    if (!isReal(w)) m_lexer->fail(std::string(what) + " '" + w + "' is not a number");
    const double value = std::strtod(w.c_str(), nullptr);
    if (!std::isfinite(value)) m_lexer->fail(std::string(what) + " '" + w + "' is out of range");
    return value;
}

unsigned SvfParser::stableState(const char* what)
{
    const int state = SvfStates::byName(m_lexer->word());
    if (state < 0) m_lexer->fail("'" + m_lexer->word() + "' is not a TAP state");
    if (!SvfStates::isStable(static_cast<unsigned>(state)))
        m_lexer->fail(std::string(what) + " must be a stable state (RESET, IDLE, DRPAUSE, IRPAUSE), not " +
                      m_lexer->word());
    return static_cast<unsigned>(state);
}

bool SvfParser::read(SvfStatement& out)
{
    m_lexer->setStatementLine(0);
    const SvfLexer::Token first = m_lexer->next();
    if (first == SvfLexer::Token::End) return false;
    out.line = m_lexer->tokenLine();
    m_lexer->setStatementLine(out.line);
    if (first != SvfLexer::Token::Word) m_lexer->fail("expected a command");
    const std::string keyword = m_lexer->word();
    if (keyword == "PIO" || keyword == "PIOMAP") m_lexer->fail(keyword + " is not supported (parallel I/O)");
    const Command* command = nullptr;
    for (const Command& c : kCommands)
        if (keyword == c.word) command = &c;
    if (!command) m_lexer->fail("unknown command '" + keyword + "'");
    out.kind = command->kind;

    switch (out.kind) {
    case Kind::EndDR:
    case Kind::EndIR:
        expectWord("a stable state");
        out.states.assign(1, stableState(command->word));
        expectSemicolon(command->word);
        break;
    case Kind::Frequency: {
        const SvfLexer::Token t = m_lexer->next();
        out.hz = -1;
        if (t == SvfLexer::Token::Semicolon) break;
        if (t != SvfLexer::Token::Word) m_lexer->fail("expected a frequency");
        out.hz = real("frequency");
        if (out.hz <= 0) m_lexer->fail("frequency must be above 0");
        expectWord("HZ");
        if (m_lexer->word() != "HZ") m_lexer->fail("expected HZ after the frequency");
        expectSemicolon("FREQUENCY");
        break;
    }
    case Kind::RunTest: readRunTest(out); break;
    case Kind::State: {
        out.states.clear();
        for (;;) {
            const SvfLexer::Token t = m_lexer->next();
            if (t == SvfLexer::Token::Semicolon) break;
            if (t == SvfLexer::Token::End) m_lexer->fail("statement without ';' at the end of the file");
            if (t != SvfLexer::Token::Word) m_lexer->fail("expected a TAP state");
            const int s = SvfStates::byName(m_lexer->word());
            if (s < 0) m_lexer->fail("'" + m_lexer->word() + "' is not a TAP state");
            out.states.push_back(static_cast<unsigned>(s));
        }
        if (out.states.empty()) m_lexer->fail("STATE without a state");
        if (!SvfStates::isStable(out.states.back()))
            m_lexer->fail(std::string("STATE must end in a stable state, not ") + SvfStates::name(out.states.back()));
        break;
    }
    case Kind::Trst: {
        expectWord("ON, OFF, Z or ABSENT");
        const std::string& w = m_lexer->word();
        if (w == "ON") out.trst = SvfStatement::TrstMode::On;
        else if (w == "OFF") out.trst = SvfStatement::TrstMode::Off;
        else if (w == "Z") out.trst = SvfStatement::TrstMode::Z;
        else if (w == "ABSENT") out.trst = SvfStatement::TrstMode::Absent;
        else m_lexer->fail("TRST mode '" + w + "' is not ON, OFF, Z or ABSENT");
        expectSemicolon("TRST");
        break;
    }
    default: readScan(out); break;
    }
    m_lexer->setStatementLine(0);
    return true;
}

void SvfParser::readScan(SvfStatement& out)
{
    expectWord("a length");
    out.length = integer("length");
    for (bool& g : out.given) g = false;
    for (;;) {
        const SvfLexer::Token t = m_lexer->next();
        if (t == SvfLexer::Token::Semicolon) return;
        if (t == SvfLexer::Token::End) m_lexer->fail("statement without ';' at the end of the file");
        if (t != SvfLexer::Token::Word) m_lexer->fail("expected TDI, TDO, MASK or SMASK");
        int param = -1;
        for (int p = 0; p < 4; ++p)
            if (m_lexer->word() == kParamNames[p]) param = p;
        if (param < 0) m_lexer->fail("'" + m_lexer->word() + "' is not TDI, TDO, MASK or SMASK");
        if (out.given[param]) m_lexer->fail(std::string(kParamNames[param]) + " given twice");
        if (m_lexer->next() != SvfLexer::Token::Open) m_lexer->fail(std::string("expected '(' after ") + kParamNames[param]);
        m_lexer->readHex(m_digits);
        if (!out.vector[param].assignHex(m_digits, out.length))
            m_lexer->fail(std::string(kParamNames[param]) + " value does not fit in " + std::to_string(out.length) +
                          " bits");
        out.given[param] = true;
    }
}

void SvfParser::readRunTest(SvfStatement& out)
{
    out.runState = out.endState = -1;
    out.hasCount = false;
    out.runCount = 0;
    out.minTime = out.maxTime = -1;
    expectWord("a run state, count or time");
    if (!isNumberStart(m_lexer->word())) {
        out.runState = static_cast<int>(stableState("the RUNTEST run state"));
        expectWord("a count or time");
    }
    if (!isNumberStart(m_lexer->word())) m_lexer->fail("expected a count or time, not '" + m_lexer->word() + "'");
    const std::string number = m_lexer->word();
    expectWord("TCK, SCK or SEC");
    const std::string unit = m_lexer->word();
    SvfLexer::Token t;
    if (unit == "TCK" || unit == "SCK") {
        if (unit == "SCK") m_lexer->fail("RUNTEST with SCK is not supported (no system clock on a JTAG cable)");
        out.hasCount = true;
        out.runCount = integer("run count", number);
        t = m_lexer->next();
        if (t == SvfLexer::Token::Word && isNumberStart(m_lexer->word())) {
            out.minTime = real("minimum time");
            expectWord("SEC");
            if (m_lexer->word() != "SEC") m_lexer->fail("expected SEC after the minimum time");
            t = m_lexer->next();
        }
    } else if (unit == "SEC") {
        out.minTime = real("minimum time", number);
        t = m_lexer->next();
    } else {
        m_lexer->fail("expected TCK, SCK or SEC, not '" + unit + "'");
    }
    if (t == SvfLexer::Token::Word && m_lexer->word() == "MAXIMUM") {
        if (out.minTime < 0) m_lexer->fail("MAXIMUM without a minimum time");
        expectWord("a maximum time");
        out.maxTime = real("maximum time");
        expectWord("SEC");
        if (m_lexer->word() != "SEC") m_lexer->fail("expected SEC after the maximum time");
        if (out.maxTime < out.minTime) m_lexer->fail("MAXIMUM time is below the minimum time");
        t = m_lexer->next();
    }
    if (t == SvfLexer::Token::Word && m_lexer->word() == "ENDSTATE") {
        expectWord("a stable state");
        out.endState = static_cast<int>(stableState("the RUNTEST end state"));
        t = m_lexer->next();
    }
    if (t == SvfLexer::Token::Semicolon) return;
    if (t == SvfLexer::Token::End) m_lexer->fail("statement without ';' at the end of the file");
    if (t == SvfLexer::Token::Word) m_lexer->fail("unexpected '" + m_lexer->word() + "' in RUNTEST");
    m_lexer->fail("expected ';' after RUNTEST");
}

} // namespace JexRT
