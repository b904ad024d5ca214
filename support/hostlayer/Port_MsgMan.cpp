// SPDX-License-Identifier: MIT
#include "hostlayer/Port_MsgMan.hpp"

#include <cwchar>

Port_MsgMan::~Port_MsgMan() = default;

void Port_MsgMan::output(MsgType type, const wchar_t* format, ...)
{
    wchar_t buffer[1024];
    va_list args;
    va_start(args, format);
    msgFormat(buffer, sizeof buffer / sizeof buffer[0], format, args);
    va_end(args);
    outputMsg(type, buffer);
}

void Port_MsgMan::msgFormat(wchar_t* buffer, unsigned size, const wchar_t* format, va_list args)
{
    if (!buffer || size == 0) return;
    buffer[0] = L'\0';
    if (!format) return;
    if (std::vswprintf(buffer, size, format, args) < 0) buffer[size - 1] = L'\0';
}
