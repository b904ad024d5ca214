// SPDX-License-Identifier: MIT
#include "util/MethodLogger.hpp"

void MethodLogger::traceExit() const
{
    switch (m_kind) {
    case Kind::Status:
        Logger::logger.printLog(kTraceLevel, "< %s %s\n", m_name,
                                (m_value & 0x80000000u) ? "JEX_FAILURE" : "JEX_SUCCESS");
        break;
    case Kind::Value: Logger::logger.printLog(kTraceLevel, "< %s = %u\n", m_name, m_value); break;
    case Kind::None: Logger::logger.logMethodExit(m_name); break;
    }
}

void MethodLogger::setMethodName(const std::string& name)
{
    if (!Logger::logger.isEnabled(kTraceLevel)) return;
    m_ownedName = std::make_unique<std::string>(name);
    setMethodName(m_ownedName->c_str());
}
