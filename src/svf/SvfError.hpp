// SPDX-License-Identifier: MIT
#pragma once
// SvfError - what stops an SVF play: a fault in the text (or a file that
// cannot be read), a failed cable operation, or the host cancelling.  Carries
// the line of the statement it belongs to (0: none).

#include <cstdint>
#include <stdexcept>
#include <string>

namespace JexRT {

class SvfError : public std::runtime_error {
public:
    enum class Kind { BadFile, Cable, Cancelled };
    SvfError(Kind kind, uint64_t line, const std::string& text) : std::runtime_error(text), m_kind(kind), m_line(line) {}
    Kind kind() const { return m_kind; }
    uint64_t line() const { return m_line; }

private:
    Kind m_kind;
    uint64_t m_line;
};

} // namespace JexRT
