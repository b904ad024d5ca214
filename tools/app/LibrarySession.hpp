// SPDX-License-Identifier: MIT
#pragma once
// One library session for the program's run: created with the message
// callback that shows the library's messages, destroyed at the end.

#include <string>
#include <vector>

#include "MessageSink.hpp"
#include "Options.hpp"
#include "TargetsOutput.hpp"

namespace jexjtag::cli {

class LibrarySession {
public:
    // Throws CliError when the library refuses the session.
    LibrarySession(const Options& options, MessageSink& sink);
    ~LibrarySession();
    LibrarySession(const LibrarySession&) = delete;
    LibrarySession& operator=(const LibrarySession&) = delete;

    unsigned handle() const { return m_handle; }
    MessageSink& sink() const { return *m_sink; }

    // The target types of the loaded plug-ins, in discovery order; the
    // descriptor texts only when withXml.  Throws CliError.
    std::vector<TargetEntry> targets(bool withXml) const;

private:
    unsigned m_handle = 0;
    MessageSink* m_sink;
};

} // namespace jexjtag::cli
