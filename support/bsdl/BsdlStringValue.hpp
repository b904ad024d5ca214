// SPDX-License-Identifier: MIT
#pragma once
// BsdlStringValue - the text of a string expression ("a" & "b" & ...) as one
// string, remembering on which line each literal stood so that a problem
// found later inside the text can be placed on its line.

#include <cstddef>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace jexbsdl {

class BsdlStringValue {
public:
    void clear();
    // Appends one literal that stood on `line`.
    void append(std::string_view literal, unsigned line);

    const std::string& text() const { return m_text; }
    size_t size() const { return m_text.size(); }
    // The line of the literal that holds the character at `offset` (the
    // last literal's line for the end of the text; 0 for an empty value).
    unsigned lineAt(size_t offset) const;
    unsigned firstLine() const { return m_pieces.empty() ? 0 : m_pieces.front().second; }

private:
    std::string m_text;
    std::vector<std::pair<size_t, unsigned>> m_pieces; // (start offset, line)
};

} // namespace jexbsdl
