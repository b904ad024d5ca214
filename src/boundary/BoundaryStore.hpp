#pragma once
// BoundaryStore - a session's boundary-scan state: the BSDL parts it has
// opened (numbered from 1) and its BSDL library.

#include <map>
#include <memory>

#include "boundary/BsdlLibrary.hpp"
#include "boundary/BsdlPart.hpp"

namespace JexRT {

class BoundaryStore {
public:
    // Keeps the part; returns its number (never 0).
    unsigned add(std::unique_ptr<BsdlPart> part);
    // The part of that number, or null.
    const BsdlPart* find(unsigned number) const;
    // False when no part has that number.
    bool remove(unsigned number);

    BsdlLibrary& library() { return m_library; }

private:
    std::map<unsigned, std::unique_ptr<BsdlPart>> m_parts;
    unsigned m_next = 1;
    BsdlLibrary m_library;
};

} // namespace JexRT
