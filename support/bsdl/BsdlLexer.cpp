// SPDX-License-Identifier: MIT
#include "bsdl/BsdlLexer.hpp"

#include <cstring>

namespace jexbsdl {

namespace {

bool isLineEnd(char c) { return c == '\n' || c == '\r'; }

} // namespace

BsdlLexer::BsdlLexer(const char* data, size_t size, BsdlDiagnostics& diagnostics)
    : m_pos(data), m_end(data + size), m_diagnostics(diagnostics)
{
    if (!data) m_pos = m_end = nullptr;
    // A UTF-8 byte-order mark, as editors on Windows like to write.
    if (size >= 3 && std::memcmp(data, "\xEF\xBB\xBF", 3) == 0) m_pos += 3;
}

void BsdlLexer::skipSpaceAndComments()
{
    while (m_pos < m_end) {
        const char c = *m_pos;
        if (c == '\n') {
            ++m_line;
            ++m_pos;
        } else if (c == '\r') {
            ++m_pos;
            if (m_pos < m_end && *m_pos == '\n') ++m_pos;
            ++m_line;
        } else if (c == ' ' || c == '\t' || c == '\v' || c == '\f') {
            ++m_pos;
        } else if (c == '-' && m_pos + 1 < m_end && m_pos[1] == '-') {
            m_pos += 2;
            while (m_pos < m_end && !isLineEnd(*m_pos)) ++m_pos;
        } else {
            break;
        }
    }
}

void BsdlLexer::next(BsdlToken& token)
{
    skipSpaceAndComments();
    token.line = m_line;
    if (m_pos >= m_end) {
        // The end lies on the file's last line, not on the empty one after
        // its final line end.
        if (m_line > 1 && m_end && isLineEnd(m_end[-1])) token.line = m_line - 1;
        token.kind = BsdlToken::Kind::End;
        token.text = std::string_view();
        return;
    }
    const char* start = m_pos;
    const char c = *m_pos;
    if (isLetter(c)) {
        ++m_pos;
        while (m_pos < m_end && isIdentifierChar(*m_pos)) ++m_pos;
        token.kind = BsdlToken::Kind::Identifier;
        token.text = std::string_view(start, static_cast<size_t>(m_pos - start));
        return;
    }
    if (isDigit(c)) {
        lexNumber(token);
        return;
    }
    if (c == '"') {
        lexString(token);
        return;
    }
    if (c == '\\') {
        lexExtendedIdentifier(token);
        return;
    }
    if (m_pos + 1 < m_end) {
        const char d = m_pos[1];
        if ((c == ':' && d == '=') || (c == '=' && d == '>') || (c == '<' && (d == '=' || d == '>')) ||
            (c == '>' && d == '=') || (c == '/' && d == '=') || (c == '*' && d == '*')) {
            m_pos += 2;
            token.kind = BsdlToken::Kind::Delimiter;
            token.text = std::string_view(start, 2);
            return;
        }
    }
    ++m_pos;
    token.kind = (c != '\0' && std::strchr("&'()*+,-./:;<=>|", c)) ? BsdlToken::Kind::Delimiter
                                                                    : BsdlToken::Kind::Other;
    token.text = std::string_view(start, 1);
}

void BsdlLexer::lexNumber(BsdlToken& token)
{
    const char* start = m_pos;
    token.kind = BsdlToken::Kind::Integer;
    while (m_pos < m_end && (isDigit(*m_pos) || *m_pos == '_')) ++m_pos;
    if (m_pos + 1 < m_end && *m_pos == '.' && isDigit(m_pos[1])) {
        token.kind = BsdlToken::Kind::Real;
        ++m_pos;
        while (m_pos < m_end && (isDigit(*m_pos) || *m_pos == '_')) ++m_pos;
    }
    if (m_pos < m_end && (*m_pos == 'e' || *m_pos == 'E')) {
        const char* p = m_pos + 1;
        if (p < m_end && (*p == '+' || *p == '-')) ++p;
        if (p < m_end && isDigit(*p)) {
            while (p < m_end && isDigit(*p)) ++p;
            m_pos = p;
        }
    }
    token.text = std::string_view(start, static_cast<size_t>(m_pos - start));
}

void BsdlLexer::lexString(BsdlToken& token)
{
    const char* start = m_pos;
    const char* contents = ++m_pos;
    bool doubledQuotes = false;
    for (;;) {
        if (m_pos >= m_end || isLineEnd(*m_pos)) {
            unclosed(token, start, "string literal");
            return;
        }
        if (*m_pos == '"') {
            if (m_pos + 1 < m_end && m_pos[1] == '"') {
                doubledQuotes = true;
                m_pos += 2;
                continue;
            }
            break;
        }
        ++m_pos;
    }
    token.kind = BsdlToken::Kind::String;
    if (!doubledQuotes) {
        token.text = std::string_view(contents, static_cast<size_t>(m_pos - contents));
    } else {
        m_scratch.clear();
        for (const char* p = contents; p < m_pos; ++p) {
            m_scratch += *p;
            if (*p == '"') ++p; // skip the second quote of the pair
        }
        token.text = m_scratch;
    }
    ++m_pos; // the closing quote
}

void BsdlLexer::lexExtendedIdentifier(BsdlToken& token)
{
    const char* start = m_pos++;
    for (;;) {
        if (m_pos >= m_end || isLineEnd(*m_pos)) {
            unclosed(token, start, "extended identifier");
            return;
        }
        if (*m_pos == '\\') {
            if (m_pos + 1 < m_end && m_pos[1] == '\\') {
                m_pos += 2;
                continue;
            }
            break;
        }
        ++m_pos;
    }
    ++m_pos;
    token.kind = BsdlToken::Kind::Identifier;
    token.text = std::string_view(start, static_cast<size_t>(m_pos - start));
}

void BsdlLexer::unclosed(BsdlToken& token, const char* start, const char* what)
{
    if (!m_lenient) m_diagnostics.error(m_line, std::string(what) + " is not closed before the end of the line");
    token.kind = BsdlToken::Kind::Other;
    token.text = std::string_view(start, static_cast<size_t>(m_pos - start));
}

} // namespace jexbsdl
