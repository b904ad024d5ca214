// SPDX-License-Identifier: MIT
#pragma once
// BsdlLexer - splits a BSDL text into VHDL tokens.
//
// Comments ("--" to the end of the line) and white space are skipped; CR,
// LF and CR LF all end a line.  A string literal must close on its own line
// (a doubled quote stands for a quote).  The lexer works on the caller's
// buffer and keeps no tokens: each next() overwrites the previous token.
//
// In lenient mode (used for text around the entity, which may hold things
// that are not BSDL at all) an unclosed string or extended identifier
// becomes an Other token instead of an error.

#include <cstddef>
#include <string>

#include "bsdl/BsdlDiagnostics.hpp"
#include "bsdl/BsdlToken.hpp"

namespace jexbsdl {

class BsdlLexer {
public:
    BsdlLexer(const char* data, size_t size, BsdlDiagnostics& diagnostics);

    void setLenient(bool lenient) { m_lenient = lenient; }
    // Reads the next token into `token` (kind End at the end of the text).
    void next(BsdlToken& token);
    // The line the lexer has reached.
    unsigned line() const { return m_line; }

private:
    void skipSpaceAndComments();
    void lexNumber(BsdlToken& token);
    void lexString(BsdlToken& token);
    void lexExtendedIdentifier(BsdlToken& token);
    void unclosed(BsdlToken& token, const char* start, const char* what);

    const char* m_pos;
    const char* m_end;
    unsigned m_line = 1;
    bool m_lenient = false;
    std::string m_scratch; // string contents with doubled quotes undone
    BsdlDiagnostics& m_diagnostics;
};

} // namespace jexbsdl
