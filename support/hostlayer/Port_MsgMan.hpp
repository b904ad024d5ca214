// SPDX-License-Identifier: MIT
#pragma once
// A message manager of the host layer: receives every message raised inside
// the host layer and the libraries built on it (the BSDL reader, for one).

#include <cstdarg>

class Port_MsgMan {
public:
    // Kinds of host-layer messages.
    enum MsgType : int {
        MSG_ERROR = 0,
        MSG_WARNING = 1,
        MSG_INFO = 2,
        MSG_DEBUG = 3,
        MSG_FATAL = 4,
        MSG_SYSTEM_ERROR = 5,
        MSG_IO_ERROR = 6,
        MSG_STATUS = 7,
        MSG_INTERNAL_ERROR = 8,
        MSG_TRACE = 9
    };

    virtual ~Port_MsgMan();
    // Formats a message (printf style, wide) and hands it to outputMsg.
    virtual void output(MsgType type, const wchar_t* format, ...);
    // Receives one finished message.
    virtual void outputMsg(MsgType type, const wchar_t* text) = 0;
    // Formats into a wide buffer of `size` characters (always terminated).
    virtual void msgFormat(wchar_t* buffer, unsigned size, const wchar_t* format, va_list args);
};
