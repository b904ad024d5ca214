// SPDX-License-Identifier: MIT
#pragma once
// SvfParser - reads whole statements from an SvfLexer and checks what can be
// checked without context: keywords, numbers, that a vector fits its
// length, stable states where the statement needs one.  PIO and PIOMAP are
// refused.  Errors are SvfError(BadFile) on the statement's first line.

#include <cstdint>
#include <string>
#include <vector>

#include "svf/SvfStatement.hpp"

namespace JexRT {

class SvfLexer;

class SvfParser {
public:
    explicit SvfParser(SvfLexer& lexer) : m_lexer(&lexer) {}

    // Reads the next statement into `out`; false at the end of the text.
    bool read(SvfStatement& out);

private:
    void readScan(SvfStatement& out);
    void readRunTest(SvfStatement& out);
    unsigned stableState(const char* what);
    void expectSemicolon(const char* after);
    void expectWord(const char* what);
    // The lexer's last word (or `text`) as a decimal count, or a real number.
    uint32_t integer(const char* what);
    uint32_t integer(const char* what, const std::string& text);
    double real(const char* what);
    double real(const char* what, const std::string& text);

    SvfLexer* m_lexer;
    std::vector<uint8_t> m_digits;
};

} // namespace JexRT
