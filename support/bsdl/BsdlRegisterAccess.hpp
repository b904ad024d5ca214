// SPDX-License-Identifier: MIT
#pragma once
// BsdlRegisterAccess - the REGISTER_ACCESS attribute: which data register
// each instruction selects, for example
//   "BOUNDARY (EXTEST, SAMPLE), DEVICE_ID (IDCODE), IOCSR[10476] (CONFIG_IO)".

#include <string>
#include <vector>

#include "bsdl/BsdlDiagnostics.hpp"
#include "bsdl/BsdlStringValue.hpp"

namespace jexbsdl {

class BsdlRegisterAccess {
public:
    struct Entry {
        std::string registerName;              // as written
        unsigned length = 0;                   // "[n]"; 0 when not given
        std::vector<std::string> instructions; // as written
    };

    // Parses the attribute; throws (through diagnostics) on bad syntax.
    void parse(const BsdlStringValue& value, BsdlDiagnostics& diagnostics);

    const std::vector<Entry>& entries() const { return m_entries; }

private:
    std::vector<Entry> m_entries;
};

} // namespace jexbsdl
