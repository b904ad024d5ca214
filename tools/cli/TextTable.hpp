// SPDX-License-Identifier: MIT
#pragma once
// Columns of text lined up with two blanks between them.  Columns marked
// right-aligned are padded on the left (numbers); the last column is never
// padded on the right.

#include <ostream>
#include <string>
#include <vector>

namespace jexjtag::cli {

class TextTable {
public:
    // rightAligned[i] for column i; missing entries mean left-aligned.
    explicit TextTable(std::vector<bool> rightAligned = {});

    void addRow(std::vector<std::string> cells);
    // Writes every row, each line starting with indent.
    void write(std::ostream& out, const std::string& indent = "") const;

private:
    std::vector<bool> m_rightAligned;
    std::vector<std::vector<std::string>> m_rows;
};

} // namespace jexjtag::cli
