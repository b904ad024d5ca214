// SPDX-License-Identifier: MIT
#include "bsdl/BsdlRegisterAccess.hpp"

#include "bsdl/BsdlTextScanner.hpp"

namespace jexbsdl {

void BsdlRegisterAccess::parse(const BsdlStringValue& value, BsdlDiagnostics& diagnostics)
{
    BsdlTextScanner s(value, diagnostics, "REGISTER_ACCESS");
    m_entries.clear();
    if (s.atEnd()) return;
    for (;;) {
        Entry entry;
        entry.registerName = s.identifier("a register name");
        if (s.accept('[')) {
            entry.length = static_cast<unsigned>(s.number("the length of register " + entry.registerName));
            s.expect(']', "after the length of register " + entry.registerName);
        }
        s.expect('(', "after register " + entry.registerName);
        do {
            entry.instructions.push_back(s.identifier("an instruction name for register " + entry.registerName));
            // IEEE 1149.1-2013: "NAME CAPTURES 01X" gives what the register captures.
            if (s.atLetter()) {
                const size_t at = s.position();
                const std::string word = s.identifier("CAPTURES");
                if (!equalsIgnoreCase(word, "CAPTURES")) s.failAt(at, "',' or ')' expected, found " + quoted(word));
                s.word("the captured bits", ",()");
            }
        } while (s.accept(','));
        s.expect(')', "after the instructions of register " + entry.registerName);
        m_entries.push_back(std::move(entry));
        if (s.atEnd()) return;
        s.expect(',', "between registers");
        if (s.atEnd()) return;
    }
}

} // namespace jexbsdl
