// SPDX-License-Identifier: MIT
#include "hostlayer/Port_MsgManDefault.hpp"

#include <cstdio>

Port_MsgManDefault::Port_MsgManDefault(const char* name) : m_name(name ? name : "") {}

Port_MsgManDefault::~Port_MsgManDefault() = default;

void Port_MsgManDefault::outputMsg(MsgType type, const wchar_t* text)
{
    const char* kind = "message";
    switch (type) {
    case MSG_ERROR:
    case MSG_FATAL:
    case MSG_SYSTEM_ERROR:
    case MSG_IO_ERROR:
    case MSG_INTERNAL_ERROR: kind = "error"; break;
    case MSG_WARNING: kind = "warning"; break;
    case MSG_DEBUG:
    case MSG_TRACE: return; // not printed
    default: break;
    }
    std::fprintf(stderr, "%s%s%s: %ls\n", m_name.c_str(), m_name.empty() ? "" : ": ", kind,
                 text ? text : L"");
}
