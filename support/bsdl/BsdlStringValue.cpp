// SPDX-License-Identifier: MIT
#include "bsdl/BsdlStringValue.hpp"

#include <algorithm>

namespace jexbsdl {

void BsdlStringValue::clear()
{
    m_text.clear();
    m_pieces.clear();
}

void BsdlStringValue::append(std::string_view literal, unsigned line)
{
    if (m_pieces.empty() || m_pieces.back().second != line) m_pieces.emplace_back(m_text.size(), line);
    m_text.append(literal.data(), literal.size());
}

unsigned BsdlStringValue::lineAt(size_t offset) const
{
    if (m_pieces.empty()) return 0;
    // The last piece that starts at or before offset.
    auto it = std::upper_bound(m_pieces.begin(), m_pieces.end(), offset,
                               [](size_t off, const std::pair<size_t, unsigned>& piece) { return off < piece.first; });
    if (it == m_pieces.begin()) return m_pieces.front().second;
    return std::prev(it)->second;
}

} // namespace jexbsdl
