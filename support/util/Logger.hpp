// SPDX-License-Identifier: MIT
#pragma once
// Logger - the process-wide log of the library.
//
// Levels: 1 errors, 2 progress and messages passed on, 3 call tracing,
// 4 method entry/exit, 5 fine detail (descriptor parsing, buffer dumps).
// JEXJTAG_LOG_LEVEL chooses the highest level written (0, the default,
// writes nothing); JEXJTAG_LOG_FILE names a file to append to (default:
// standard error).  Each line is the caller's formatted text, after a short
// prefix "[jexjtag N] " that names its level; a line written in several
// calls (the first ones without a line end) gets one prefix.  Safe to use
// from several threads.  A level that is not enabled
// costs one comparison: nothing is formatted or allocated.

#include <atomic>
#include <cstdarg>
#include <cstdio>
#include <mutex>
#include <string>

class Logger {
public:
    static Logger logger;

    // Reads JEXJTAG_LOG_LEVEL and JEXJTAG_LOG_FILE (again: a changed
    // setting takes effect).
    void startLogging();
    // Sets level and sink directly; an empty path means standard error.
    void configure(int level, const std::string& path);

    bool isEnabled(int level) const { return level <= m_level.load(std::memory_order_relaxed) && level > 0; }
    int level() const { return m_level.load(std::memory_order_relaxed); }

    void printLog(int level, const char* format, ...)
#if defined(__GNUC__)
        __attribute__((format(printf, 3, 4)))
#endif
    {
        if (!isEnabled(level)) return;
        va_list args;
        va_start(args, format);
        write(level, format, args);
        va_end(args);
    }
    void vprintLog(int level, const char* format, va_list args)
    {
        if (isEnabled(level)) write(level, format, args);
    }
    // Hex dump of the first (bitLength + 7) / 8 bytes, under a title line.
    void dumpBuffer(int level, const char* title, const unsigned char* bytes, unsigned bitLength);
    void logMethodEntry(const char* name);
    void logMethodExit(const char* name);

    constexpr Logger() = default;
    // Leaves the sink open: lines may still come from atexit handlers and
    // global destructors, and the process closes the file at its end.
    ~Logger() = default;
    Logger(const Logger&) = delete;
    Logger& operator=(const Logger&) = delete;

private:
    void write(int level, const char* format, va_list args);
    void openSink(const std::string& path);

    // Lines of several threads are written whole, one at a time.
    std::mutex m_mutex;
    std::atomic<int> m_level {0};
    // True after a write that did not end its line: the next write goes on
    // that line, without a prefix of its own.
    bool m_midLine = false;
    std::FILE* m_file = nullptr; // null: standard error
    char m_path[4096] = {};
};
