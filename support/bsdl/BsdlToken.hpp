// SPDX-License-Identifier: MIT
#pragma once
// One lexical element of a BSDL (VHDL subset) text.

#include <string_view>

#include "bsdl/BsdlText.hpp"

namespace jexbsdl {

struct BsdlToken {
    enum class Kind {
        End,        // end of the text
        Identifier, // letters, digits and underscores; also \extended\ identifiers
        Integer,    // decimal digits (underscores allowed)
        Real,       // 10.0e6 and the like
        String,     // "..." on one line; text holds the contents without quotes
        Delimiter,  // & ( ) , : ; := and the other VHDL delimiters
        Other       // a character that has no place in VHDL
    };

    Kind kind = Kind::End;
    // The element as written (for strings: the contents, doubled quotes
    // undone).  Points into the lexer's input or scratch buffer and stays
    // valid only until the lexer's next token.
    std::string_view text;
    // Line the element starts on (1-based).
    unsigned line = 0;

    bool isDelimiter(std::string_view d) const { return kind == Kind::Delimiter && text == d; }
    bool isKeyword(std::string_view word) const
    {
        return kind == Kind::Identifier && equalsIgnoreCase(text, word);
    }
};

} // namespace jexbsdl
