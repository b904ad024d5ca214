// SPDX-License-Identifier: MIT
#pragma once
// SvfLexer - the tokens of SVF text read chunk by chunk: words (keywords,
// numbers and state names, upper-cased), "(", ")" and ";".  White space
// separates tokens; comments ("!" or "//" to the end of the line) are
// skipped anywhere, also inside scan data.  Scan data is read by readHex
// straight into digits, so a vector of many megabits costs one pass.
//
// Errors are SvfError(BadFile) on the line set by setStatementLine (the
// statement being read), or the current line when none is set.

#include <cstdint>
#include <functional>
#include <string>
#include <vector>

namespace JexRT {

class SvfInput;

class SvfLexer {
public:
    enum class Token { Word, Open, Close, Semicolon, End };
    static constexpr size_t kMaxWord = 4096;

    explicit SvfLexer(SvfInput& input) : m_input(&input) {}

    // Called with offset() each time a new chunk is taken (it may throw).
    void setChunkHook(std::function<void(uint64_t)> hook) { m_hook = std::move(hook); }
    void setStatementLine(uint64_t line) { m_statementLine = line; }

    Token next();
    // The last Word, upper-cased.
    const std::string& word() const { return m_word; }
    // The line of the last token (1-based).
    uint64_t tokenLine() const { return m_tokenLine; }
    // Bytes of text consumed so far.
    uint64_t offset() const { return m_before + static_cast<uint64_t>(m_p - m_chunk); }

    // After "(": the hex digits up to ")" as values 0..15, most significant
    // first, leading zeros dropped.  The storage of digits is reused.
    void readHex(std::vector<uint8_t>& digits);

    [[noreturn]] void fail(const std::string& text) const;

private:
    bool fill();
    // Skips to the end of the line (the newline stays).
    void skipComment();
    // After a consumed "/": true (and the comment skipped) when "/" follows.
    bool slashComment();

    SvfInput* m_input;
    std::function<void(uint64_t)> m_hook;
    const char* m_chunk = nullptr;
    const char* m_p = nullptr;
    const char* m_end = nullptr;
    uint64_t m_before = 0;
    uint64_t m_line = 1;
    uint64_t m_tokenLine = 1;
    uint64_t m_statementLine = 0;
    std::string m_word;
};

} // namespace JexRT
