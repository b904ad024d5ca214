// SPDX-License-Identifier: MIT
#pragma once
// The open target of a session: opened by type name with the open
// arguments, optionally locked; unlocked and closed at the end.

#include <string>

#include "LibrarySession.hpp"
#include "Options.hpp"

namespace jexjtag::cli {

class TargetConnection {
public:
    // Opens options.targetType with options.targetArgs.  An unknown type or a
    // refused open throws CliError.
    TargetConnection(const LibrarySession& session, const Options& options);
    ~TargetConnection();
    TargetConnection(const TargetConnection&) = delete;
    TargetConnection& operator=(const TargetConnection&) = delete;

    unsigned handle() const { return m_handle; }
    const std::string& type() const { return m_type; }

    // Takes the cable lock, waiting up to msWait ms; throws CliError when
    // another process holds it (or the plug-in refuses it).
    void lock(unsigned msWait);

private:
    unsigned m_handle;
    MessageSink* m_sink;
    std::string m_type;
    bool m_locked = false;
};

} // namespace jexjtag::cli
