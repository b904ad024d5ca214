// SPDX-License-Identifier: MIT
#pragma once
// BsdlDiagnostics - how the BSDL reader reports what it finds wrong with a
// file.  Errors end the reading as a Port::Exception; warnings (oddities the
// reader can live with) are raised through the host layer's dispatcher, so
// they reach every message manager, the library's sessions among them.
// Every message names the file and, where it has one, the line.

#include <string>

#include "hostlayer/Port_MsgMan.hpp"

namespace jexbsdl {

class BsdlDiagnostics {
public:
    // A file gets at most this many warnings; one more says the rest were
    // suppressed.
    static constexpr unsigned kMaxWarnings = 20;

    explicit BsdlDiagnostics(std::string fileName);

    // Throws Port::Exception with the message.  line 0: no line is named.
    [[noreturn]] void error(unsigned line, const std::string& text) const;
    // Raises a warning (MSG_WARNING) unless the limit has been reached.
    void warning(unsigned line, const std::string& text);
    // Raises an error message (MSG_ERROR) without ending anything: for a
    // failure that the caller reports as a missing reader.
    void report(unsigned line, const std::string& text) const;

    unsigned warningCount() const { return m_warnings; }
    const std::string& fileName() const { return m_fileName; }

    // "BSDL file '<name>', line <n>: <text>\n" as a wide text.
    std::wstring format(unsigned line, const std::string& text) const;

private:
    void raise(Port_MsgMan::MsgType type, unsigned line, const std::string& text) const;

    std::string m_fileName;
    unsigned m_warnings = 0;
};

} // namespace jexbsdl
