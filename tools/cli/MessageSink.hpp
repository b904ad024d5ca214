// SPDX-License-Identifier: MIT
#pragma once
// Shows the library's messages on a stream (stderr), one line each, with a
// prefix by type.  Errors, warnings, status and info are always shown;
// noise, silent and debug types only when verbose.

#include <ostream>
#include <string>

namespace jexjtag::cli {

class MessageSink {
public:
    MessageSink(std::ostream& out, bool verbose);

    // text may be null and may end with line ends of its own; the message is
    // written with exactly one line end.
    void deliver(unsigned msgType, const char* text);

    // "error: ", "warning: ", "status: ", "info: ", "noise: ", "silent: " or
    // "debug(N): ".
    static std::string prefixFor(unsigned msgType);
    static bool alwaysShown(unsigned msgType);

    // The text of the last error message delivered since clearLastError()
    // ("" when none), line ends removed.
    const std::string& lastError() const { return m_lastError; }
    void clearLastError() { m_lastError.clear(); }

private:
    std::string m_lastError;
    std::ostream& m_out;
    bool m_verbose;
};

} // namespace jexjtag::cli
