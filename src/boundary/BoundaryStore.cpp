// SPDX-License-Identifier: MIT
#include "boundary/BoundaryStore.hpp"

namespace JexRT {

unsigned BoundaryStore::add(std::unique_ptr<BsdlPart> part)
{
    if (m_next == 0) m_next = 1; // after 2^32 opens
    while (m_parts.count(m_next)) ++m_next;
    const unsigned number = m_next++;
    m_parts.emplace(number, std::move(part));
    return number;
}

const BsdlPart* BoundaryStore::find(unsigned number) const
{
    const auto it = m_parts.find(number);
    return it == m_parts.end() ? nullptr : it->second.get();
}

bool BoundaryStore::remove(unsigned number) { return m_parts.erase(number) > 0; }

} // namespace JexRT
