// SPDX-License-Identifier: MIT
#include "TextTable.hpp"

#include <algorithm>

namespace jexjtag::cli {

TextTable::TextTable(std::vector<bool> rightAligned) : m_rightAligned(std::move(rightAligned)) {}

void TextTable::addRow(std::vector<std::string> cells) { m_rows.push_back(std::move(cells)); }

void TextTable::write(std::ostream& out, const std::string& indent) const
{
    std::vector<size_t> widths;
    for (const auto& row : m_rows) {
        if (row.size() > widths.size()) widths.resize(row.size(), 0);
        for (size_t c = 0; c < row.size(); ++c) widths[c] = std::max(widths[c], row[c].size());
    }
    for (const auto& row : m_rows) {
        std::string line = indent;
        for (size_t c = 0; c < row.size(); ++c) {
            const bool right = c < m_rightAligned.size() && m_rightAligned[c];
            const bool last = c + 1 == row.size();
            const size_t pad = widths[c] - row[c].size();
            if (c > 0) line += "  ";
            if (right) line.append(pad, ' ');
            line += row[c];
            if (!right && !last) line.append(pad, ' ');
        }
        out << line << '\n';
    }
}

} // namespace jexjtag::cli
