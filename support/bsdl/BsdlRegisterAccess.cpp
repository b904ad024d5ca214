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
        s.setContext(std::string());
        entry.registerName = s.identifier("a register name");
        s.setContext("register " + entry.registerName);
        if (s.accept('[')) {
            entry.length = static_cast<unsigned>(s.number("the register length"));
            s.expect(']', "after the register length");
        }
        s.expect('(', "after the register");
        do {
            entry.instructions.emplace_back(s.identifier("an instruction name"));
            // IEEE 1149.1-2013: "NAME CAPTURES 01X" gives what the register captures.
            if (s.atLetter()) {
                const size_t at = s.position();
                const std::string_view word = s.identifier("CAPTURES");
                if (!equalsIgnoreCase(word, "CAPTURES")) s.failAt(at, "',' or ')' expected, found " + quoted(word));
                s.word("the captured bits", ",()");
            }
        } while (s.accept(','));
        s.expect(')', "after the instructions");
        m_entries.push_back(std::move(entry));
        if (s.atEnd()) return;
        s.setContext(std::string());
        s.expect(',', "between registers");
        if (s.atEnd()) return;
    }
}

} // namespace jexbsdl
