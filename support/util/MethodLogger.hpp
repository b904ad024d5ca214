#pragma once
// MethodLogger - traces one call: entry when named, exit (with the status it
// was told) when destroyed.  Written at level 4; costs nothing when off.

#include <string>

class MethodLogger {
public:
    MethodLogger() = default;
    ~MethodLogger();
    MethodLogger(const MethodLogger&) = delete;
    MethodLogger& operator=(const MethodLogger&) = delete;

    // `name` must outlive the tracer (a literal, as at every call site).
    void setMethodName(const char* name);
    void setMethodName(const std::string& name);
    // Remembers the status the function returns and gives it back.
    unsigned setReturnStatus(unsigned status);
    // Remembers a numeric result.
    void setReturn(unsigned value);

private:
    const char* m_name = nullptr;
    std::string m_ownedName;
    unsigned m_value = 0;
    enum class Kind { None, Status, Value } m_kind = Kind::None;
};
