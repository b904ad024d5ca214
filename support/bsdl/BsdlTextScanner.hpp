// SPDX-License-Identifier: MIT
#pragma once
// BsdlTextScanner - walks the text of a string-valued attribute (the
// literals already joined) for the small grammars inside BSDL strings:
// boundary cells, pin maps, register access.  Failures name the attribute
// and the line of the literal that holds the offending character.

#include <cstddef>
#include <string>
#include <string_view>

#include "bsdl/BsdlDiagnostics.hpp"
#include "bsdl/BsdlStringValue.hpp"
#include "bsdl/BsdlText.hpp"

namespace jexbsdl {

class BsdlTextScanner {
public:
    BsdlTextScanner(const BsdlStringValue& value, BsdlDiagnostics& diagnostics, std::string attribute)
        : m_value(value), m_text(value.text()), m_diagnostics(diagnostics), m_attribute(std::move(attribute))
    {
    }

    // Failures of the scanning calls below end with " (<context>)": the
    // entry being read ("cell 12", "port IO").  Empty: nothing is added.
    void setContext(std::string context) { m_context = std::move(context); }
    void setContext(const char* kind, unsigned long number)
    {
        m_context.assign(kind);
        m_context += ' ';
        m_context += std::to_string(number);
    }

    void skipSpace()
    {
        while (m_pos < m_text.size() && isSpace(m_text[m_pos])) ++m_pos;
    }
    bool atEnd()
    {
        skipSpace();
        return m_pos >= m_text.size();
    }
    // True when the next character (after white space) is a letter.
    bool atLetter()
    {
        skipSpace();
        return m_pos < m_text.size() && isLetter(m_text[m_pos]);
    }
    // True (and consumed) when the next character is c.
    bool accept(char c)
    {
        skipSpace();
        if (m_pos < m_text.size() && m_text[m_pos] == c) {
            ++m_pos;
            return true;
        }
        return false;
    }
    void expect(char c, const char* where)
    {
        if (!accept(c)) fail(std::string("'") + c + "' expected " + where + ", found " + rest());
    }
    // Letters, digits and underscores, starting with a letter.
    std::string_view identifier(const char* what)
    {
        skipSpace();
        const size_t start = m_pos;
        if (m_pos < m_text.size() && isLetter(m_text[m_pos]))
            while (m_pos < m_text.size() && isIdentifierChar(m_text[m_pos])) ++m_pos;
        if (m_pos == start) fail(std::string(what) + " expected, found " + rest());
        return std::string_view(m_text).substr(start, m_pos - start);
    }
    // Characters up to white space or one of `stops`; at least one.
    std::string_view word(const char* what, std::string_view stops)
    {
        skipSpace();
        const size_t start = m_pos;
        while (m_pos < m_text.size() && !isSpace(m_text[m_pos]) && stops.find(m_text[m_pos]) == std::string_view::npos)
            ++m_pos;
        if (m_pos == start) fail(std::string(what) + " expected, found " + rest());
        return std::string_view(m_text).substr(start, m_pos - start);
    }
    // A decimal number below 2^31.
    unsigned long number(const char* what)
    {
        skipSpace();
        const size_t start = m_pos;
        unsigned long value = 0;
        while (m_pos < m_text.size() && isDigit(m_text[m_pos])) {
            value = value * 10 + static_cast<unsigned>(m_text[m_pos] - '0');
            if (value > 0x7FFFFFFFul) fail(std::string(what) + " " + quoted(m_text.substr(start, 12)) + " is too large");
            ++m_pos;
        }
        if (m_pos == start) fail(std::string(what) + " expected, found " + rest());
        return value;
    }
    // The line of the current position.
    unsigned line() const { return m_value.lineAt(m_pos < m_text.size() ? m_pos : m_text.size()); }
    unsigned lineAt(size_t offset) const { return m_value.lineAt(offset); }
    size_t position() const { return m_pos; }

    // Fails at the current position; the context is added.
    [[noreturn]] void fail(const std::string& text) const
    {
        failAt(m_pos, m_context.empty() ? text : text + " (" + m_context + ")");
    }
    // Fails naming the line of `offset`; the text is taken as it is.
    [[noreturn]] void failAt(size_t offset, const std::string& text) const
    {
        m_diagnostics.error(m_value.lineAt(offset), m_attribute + ": " + text);
    }
    std::string rest() const
    {
        return m_pos >= m_text.size() ? std::string("the end") : quoted(std::string_view(m_text).substr(m_pos, 20));
    }

private:
    static bool isSpace(char c) { return c == ' ' || c == '\t' || c == '\r' || c == '\n' || c == '\v' || c == '\f'; }

    const BsdlStringValue& m_value;
    const std::string& m_text;
    BsdlDiagnostics& m_diagnostics;
    std::string m_attribute;
    std::string m_context;
    size_t m_pos = 0;
};

} // namespace jexbsdl
