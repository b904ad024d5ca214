// SPDX-License-Identifier: MIT
#include "TargetConnection.hpp"

#include <vector>

#include "CliError.hpp"
#include "jexjtag/jexjtag.h"

namespace jexjtag::cli {

namespace {

void checkTypeIsKnown(const LibrarySession& session, const std::string& type)
{
    const std::vector<TargetEntry> targets = session.targets(false);
    std::string names;
    for (const TargetEntry& target : targets) {
        if (target.name == type) return;
        names += (names.empty() ? "" : ", ") + target.name;
    }
    if (targets.empty())
        throw CliError("unknown target type '" + type + "': no plug-in is installed (see 'jexjtag targets')");
    throw CliError("unknown target type '" + type + "'; available: " + names);
}

} // namespace

TargetConnection::TargetConnection(const LibrarySession& session, const Options& options)
    : m_handle(session.handle()), m_sink(&session.sink()), m_type(options.targetType)
{
    checkTypeIsKnown(session, m_type);
    std::vector<const char*> argv;
    for (const std::string& arg : options.targetArgs) argv.push_back(arg.c_str());
    if (JEX_FAILED(JexJtag_target_open(m_handle, m_type.c_str(), nullptr, static_cast<unsigned>(argv.size()),
                                       argv.empty() ? nullptr : argv.data(), nullptr)))
        throw CliError("cannot open target '" + m_type + "'");
    // With AVOID_FIRMWARE_UPDATE=true the library closes a target that reports
    // new firmware and still answers success: there is no target then.
    unsigned lockStatus = JEXJTAG_NOTARGET;
    if (JEX_FAILED(JexJtag_target_getLockStatus(m_handle, &lockStatus)))
        throw CliError("target '" + m_type + "' was closed again after opening: it reports new firmware and "
                       "AVOID_FIRMWARE_UPDATE is set");
}

TargetConnection::~TargetConnection()
{
    if (m_locked) JexJtag_target_unlock(m_handle);
    JexJtag_target_close(m_handle);
}

void TargetConnection::lock(unsigned msWait)
{
    unsigned status = JEXJTAG_NOTARGET;
    m_sink->clearLastError();
    const uint32_t result = JexJtag_target_lock(m_handle, msWait, &status);
    if (!JEX_FAILED(result) && status == JEXJTAG_LOCKED_ME) {
        m_locked = true;
        return;
    }
    // Say what happened: a lock directory that cannot be used is no holder.
    const std::string& reason = m_sink->lastError();
    if (!reason.empty() && reason.find("locked by another process") == std::string::npos)
        throw CliError("cannot lock target '" + m_type + "': " + reason);
    throw CliError("cannot lock target '" + m_type + "': locked by another process (waited " +
                   std::to_string(msWait) + " ms; --lock-wait MS waits longer, --no-lock skips the lock)");
}

} // namespace jexjtag::cli
