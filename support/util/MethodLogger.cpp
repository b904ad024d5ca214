#include "util/MethodLogger.hpp"

#include "util/Logger.hpp"

namespace {
constexpr int kTraceLevel = 4;
}

MethodLogger::~MethodLogger()
{
    if (!m_name || !Logger::logger.isEnabled(kTraceLevel)) return;
    switch (m_kind) {
    case Kind::Status:
        Logger::logger.printLog(kTraceLevel, "< %s %s\n", m_name,
                                (m_value & 0x80000000u) ? "JEX_FAILURE" : "JEX_SUCCESS");
        break;
    case Kind::Value: Logger::logger.printLog(kTraceLevel, "< %s = %u\n", m_name, m_value); break;
    case Kind::None: Logger::logger.logMethodExit(m_name); break;
    }
}

void MethodLogger::setMethodName(const char* name)
{
    m_name = name;
    if (m_name && Logger::logger.isEnabled(kTraceLevel)) Logger::logger.logMethodEntry(m_name);
}

void MethodLogger::setMethodName(const std::string& name)
{
    if (!Logger::logger.isEnabled(kTraceLevel)) return;
    m_ownedName = name;
    setMethodName(m_ownedName.c_str());
}

unsigned MethodLogger::setReturnStatus(unsigned status)
{
    m_value = status;
    m_kind = Kind::Status;
    return status;
}

void MethodLogger::setReturn(unsigned value)
{
    m_value = value;
    m_kind = Kind::Value;
}
