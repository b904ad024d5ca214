// SPDX-License-Identifier: MIT
/*
 * EntryLog.h - lets a test module record the entry points and operations it
 * receives, for C and C++ modules alike.
 *
 * Each call appends one line "<module> <event>\n" to the file named by the
 * environment variable JEXJTAG_TEST_ENTRY_LOG; nothing happens while it is
 * unset.  The file is opened and closed per line, so every line is on disk
 * when the call returns, whatever happens to the process afterwards.
 * tests/support/EntryLog.hpp reads it back.
 */
#ifndef JEXJTAG_TEST_ENTRY_LOG_H
#define JEXJTAG_TEST_ENTRY_LOG_H

#include <stdarg.h>
#include <stdio.h>
#include <stdlib.h>

#define JEXJTAG_TEST_ENTRY_LOG_ENV "JEXJTAG_TEST_ENTRY_LOG"

static inline void jexTestEntryLogV(const char* module, const char* format, va_list args)
{
    const char* path = getenv(JEXJTAG_TEST_ENTRY_LOG_ENV);
    FILE* out;
    if (!path || !*path) return;
    out = fopen(path, "a");
    if (!out) return;
    fprintf(out, "%s ", module);
    vfprintf(out, format, args);
    fputc('\n', out);
    fclose(out);
}

/* Appends "<module> <formatted event>". */
static inline void jexTestEntryLog(const char* module, const char* format, ...)
#if defined(__GNUC__)
    __attribute__((format(printf, 2, 3)))
#endif
    ;
static inline void jexTestEntryLog(const char* module, const char* format, ...)
{
    va_list args;
    va_start(args, format);
    jexTestEntryLogV(module, format, args);
    va_end(args);
}

#endif /* JEXJTAG_TEST_ENTRY_LOG_H */
