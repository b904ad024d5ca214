// SPDX-License-Identifier: MIT
/*
 * svf.h - playing Serial Vector Format (SVF) files on a session's target.
 *
 * The player reads the text in chunks and runs it statement by statement: a
 * statement is read completely and checked (syntax, values that fit their
 * lengths, the sticky TDI/MASK/SMASK rules, legal state paths) before
 * anything of it reaches the cable, and play stops at the first error, so
 * nothing is shifted past a faulty statement.  A dry run (JEXJTAG_SVF_DRY_RUN)
 * checks the whole text in one pass without touching the cable.  Memory
 * grows with the largest vector of the file, not with the file.
 *
 * Before the first statement the TAP is reset with TMS (as OpenOCD's player
 * does), so play starts from Test-Logic-Reset whatever came before.
 *
 * Scans: HIR/SIR/TIR (HDR/SDR/TDR) become one whole-chain shift of the
 * composite vector, header bits shifted first.  TDO is compared under MASK;
 * header and trailer bits only when their own statement gave a TDO.  SMASK
 * is checked but every TDI bit is driven as given.  RUNTEST gives
 * max(run_count, ceil(min_time x TCK frequency)) clocks in the run state and
 * then waits on the cable for whatever of min_time has not yet passed.
 * STATE RESET always clocks TMS high at least five times.  TRST goes through
 * the plug-in option "trst" ("1" for ON, "0" for OFF and Z); a cable without it
 * gets one warning, and TRST ON then resets the TAP with TMS.  PIO and PIOMAP
 * are refused.  FREQUENCY lowers the cable's "frequency" option when the
 * cable runs faster; a FREQUENCY above the cable's speed is a warning.  The
 * cable's frequency is put back at the end.
 *
 * Warnings go to the session as JEX_MSG_WARNING messages
 * ("<file>:<line>: <text>"): a FREQUENCY above the cable's, a cable without
 * TRST, and with JEXJTAG_SVF_KEEP_GOING every TDO mismatch.  What stopped or
 * failed the play is written to the result's message; it goes to the session
 * as a JEX_MSG_ERROR message only when the caller gave no message buffer.
 */
#ifndef JEXJTAG_SVF_H
#define JEXJTAG_SVF_H

#include "types.h"

JEXJTAG_BEGIN_DECLS

/* ---- Options --------------------------------------------------------------- */
#define JEXJTAG_SVF_KEEP_GOING 0x1u /* count TDO mismatches and play on (default: stop at the first) */
#define JEXJTAG_SVF_DRY_RUN    0x2u /* parse and check the whole text; touch no cable (no target needed) */

/* Called while playing: bytes of text read so far, the text's size (0 when
 * unknown), statements run so far; `user` is JexJtagSvfOptions.progressUser.
 * Called at the start, about every 256 KiB of text and at the end.  A
 * non-zero return cancels: the statement being read does not run. */
typedef int (*JexJtagSvfProgress)(void* user, uint64_t bytesDone, uint64_t bytesTotal, uint64_t statementsDone);

typedef struct JexJtagSvfOptions {
    uint32_t           flags;          /* JEXJTAG_SVF_* bits */
    uint32_t           reserved;       /* set to 0 */
    double             maxFrequencyHz; /* TCK never above this; 0 = no cap beyond the file's FREQUENCY */
    JexJtagSvfProgress progress;       /* may be null */
    void*              progressUser;   /* handed to progress unchanged */
} JexJtagSvfOptions;

JEXJTAG_STATIC_ASSERT(offsetof(JexJtagSvfOptions, flags) == 0, "JexJtagSvfOptions.flags");
JEXJTAG_STATIC_ASSERT(offsetof(JexJtagSvfOptions, maxFrequencyHz) == 8, "JexJtagSvfOptions.maxFrequencyHz");
JEXJTAG_STATIC_ASSERT(offsetof(JexJtagSvfOptions, progress) == 16, "JexJtagSvfOptions.progress");
JEXJTAG_STATIC_ASSERT(sizeof(void*) != 8 || sizeof(JexJtagSvfOptions) == 32, "JexJtagSvfOptions is 32 bytes");

/* ---- Result ------------------------------------------------------------------ */
typedef enum JexJtagSvfOutcome {
    JEXJTAG_SVF_PASSED    = 0, /* played (or checked) to the end, every TDO check passed */
    JEXJTAG_SVF_MISMATCH  = 1, /* played, but at least one TDO check failed (see the mismatch fields) */
    JEXJTAG_SVF_BAD_FILE  = 2, /* the text has an error at errorLine (or the file cannot be read: line 0) */
    JEXJTAG_SVF_CABLE     = 3, /* the target failed an operation at errorLine, or there is no open target */
    JEXJTAG_SVF_CANCELLED = 4  /* the progress callback asked to stop */
} JexJtagSvfOutcome;

/* Filled by the play functions.  The caller owns the four text buffers and
 * sets their pointers and capacities (a null pointer or capacity 0 means "not
 * wanted"); each text is cut to capacity - 1 characters and NUL-terminated.
 * Vectors are hexadecimal, most significant digit first, as SVF writes them:
 * the statement's own bits (the whole composite vector when a header or
 * trailer statement gave a TDO).  A vector that does not fit is shown as the
 * window of digits around firstMismatchBit, with "..." on each cut side
 * (buffers of 8 bytes or more). */
typedef struct JexJtagSvfResult {
    uint64_t statements;        /* statements run (checked, in a dry run) */
    uint64_t checks;            /* scans whose TDO was compared */
    uint64_t mismatches;        /* of those, the ones that failed */
    uint64_t firstMismatchLine; /* line of the first failed check, 0 when none */
    uint64_t firstMismatchBit;  /* first differing bit in the vectors below (bit 0 = rightmost) */
    uint64_t errorLine;         /* line of the statement that stopped play with an error, 0 when none */
    uint32_t outcome;           /* a JexJtagSvfOutcome */
    uint32_t expectedSize;      /* capacity of expected */
    char*    expected;          /* caller's buffer: the first mismatch's TDO as the file wants it */
    uint32_t actualSize;
    uint32_t maskSize;
    char*    actual;            /* caller's buffer: what the chain gave */
    char*    mask;              /* caller's buffer: the MASK in effect */
    uint32_t messageSize;
    uint32_t reserved;          /* set to 0 */
    char*    message;           /* caller's buffer: "<file>:<line>: <text>" of the error, else of the
                                   first mismatch; "" when the play passed */
} JexJtagSvfResult;

JEXJTAG_STATIC_ASSERT(offsetof(JexJtagSvfResult, statements) == 0, "JexJtagSvfResult.statements");
JEXJTAG_STATIC_ASSERT(offsetof(JexJtagSvfResult, errorLine) == 40, "JexJtagSvfResult.errorLine");
JEXJTAG_STATIC_ASSERT(offsetof(JexJtagSvfResult, outcome) == 48, "JexJtagSvfResult.outcome");
JEXJTAG_STATIC_ASSERT(sizeof(void*) != 8 || offsetof(JexJtagSvfResult, expected) == 56, "JexJtagSvfResult.expected");
JEXJTAG_STATIC_ASSERT(sizeof(void*) != 8 || offsetof(JexJtagSvfResult, actual) == 72, "JexJtagSvfResult.actual");
JEXJTAG_STATIC_ASSERT(sizeof(void*) != 8 || offsetof(JexJtagSvfResult, message) == 96, "JexJtagSvfResult.message");
JEXJTAG_STATIC_ASSERT(sizeof(void*) != 8 || sizeof(JexJtagSvfResult) == 104, "JexJtagSvfResult is 104 bytes");

/* Sets *options (not null) to the defaults: stop at the first mismatch, no
 * frequency cap, no dry run, no progress callback.  JEX_FAILURE for null. */
JEXJTAG_API uint32_t JexJtag_svf_initOptions(JexJtagSvfOptions* options);

/* Plays the SVF file at `path` on the open target of the session `handle`
 * (any live session for a dry run).  options may be null (the defaults);
 * result may be null, else its counters and texts are written (the caller's
 * buffer pointers and capacities are kept).  JEX_SUCCESS when the whole file
 * played and every TDO check passed; JEX_FAILURE otherwise, with the reason
 * in result->outcome and result->message. */
JEXJTAG_API uint32_t JexJtag_svf_playFile(unsigned handle, const char* path, const JexJtagSvfOptions* options,
                                          JexJtagSvfResult* result);

/* As JexJtag_svf_playFile, for `length` bytes of SVF text at `text` (not
 * NUL-terminated necessarily; the caller keeps it).  `name` is the name
 * errors give for it (null: "<text>"). */
JEXJTAG_API uint32_t JexJtag_svf_playText(unsigned handle, const char* text, size_t length, const char* name,
                                          const JexJtagSvfOptions* options, JexJtagSvfResult* result);

JEXJTAG_END_DECLS

#endif /* JEXJTAG_SVF_H */
