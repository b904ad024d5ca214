// SPDX-License-Identifier: MIT
#pragma once
// MethodLogger - traces one call: entry when named, exit (with the status it
// was told) when destroyed.  Written at level 4.  With that level off a
// tracer costs a few comparisons: everything else is out of line.

#include <memory>
#include <string>

#include "util/Logger.hpp"

class MethodLogger {
public:
    static constexpr int kTraceLevel = 4;

    MethodLogger() = default;
    ~MethodLogger()
    {
        if (m_name && Logger::logger.isEnabled(kTraceLevel)) traceExit();
    }
    MethodLogger(const MethodLogger&) = delete;
    MethodLogger& operator=(const MethodLogger&) = delete;

    // `name` must outlive the tracer (a literal, as at every call site).
    void setMethodName(const char* name)
    {
        m_name = name;
        if (m_name && Logger::logger.isEnabled(kTraceLevel)) Logger::logger.logMethodEntry(m_name);
    }
    // A name built at run time: copied, and only when tracing is on.
    void setMethodName(const std::string& name);
    // Remembers the status the function returns and gives it back.
    unsigned setReturnStatus(unsigned status)
    {
        m_value = status;
        m_kind = Kind::Status;
        return status;
    }
    // Remembers a numeric result.
    void setReturn(unsigned value)
    {
        m_value = value;
        m_kind = Kind::Value;
    }

private:
    void traceExit() const;

    const char* m_name = nullptr;
    std::unique_ptr<std::string> m_ownedName;
    unsigned m_value = 0;
    enum class Kind { None, Status, Value } m_kind = Kind::None;
};
