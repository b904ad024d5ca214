// SPDX-License-Identifier: MIT
#pragma once
// BoundaryStore - a session's boundary-scan state: the BSDL parts it has
// opened (numbered from 1), its BSDL library and the devices pin access
// holds in EXTEST, HIGHZ or CLAMP.

#include <map>
#include <memory>

#include "boundary/BsdlLibrary.hpp"
#include "boundary/BsdlPart.hpp"
#include "boundary/PinAccess.hpp"

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
    // Devices pin access left in EXTEST, HIGHZ or CLAMP (PinAccess).
    PinAccess::HeldDevices& held() { return m_held; }

private:
    std::map<unsigned, std::unique_ptr<BsdlPart>> m_parts;
    unsigned m_next = 1;
    BsdlLibrary m_library;
    PinAccess::HeldDevices m_held;
};

} // namespace JexRT
