// SPDX-License-Identifier: MIT
/*
 * db.h - the session's device database and BSDL import.
 *
 * IDCODE texts are 1 to 32 characters '0', '1', 'X' or 'x' (X: a bit that
 * matches either value), most significant bit first; a shorter text counts
 * as having leading zeros.  Any other text fails.
 */
#ifndef JEXJTAG_DB_H
#define JEXJTAG_DB_H

#include "types.h"

JEXJTAG_BEGIN_DECLS

/* Adds an IDCODE list held in buf (bufsize bytes, embedded NUL bytes
 * included) to the session's database; its entries win over the
 * installation's for the same pattern.  filename only labels messages and
 * must not be null; buf may be null only when bufsize is 0.  A bad line
 * fails; the lines before it stay. */
JEXJTAG_API uint32_t JexJtag_db_addDeviceData(unsigned handle, const char* filename, const char* buf,
                                              unsigned bufsize);

/* Looks an IDCODE up.  A code nobody knows succeeds with an empty name, IR
 * length 0 and an empty BYPASS text.  The BYPASS text is one '1' per bit of
 * the IR length.  Texts are copied into their buffer, padded with NUL bytes
 * and cut to the buffer size - 1.  On failure (unknown handle, null idcode,
 * a given buffer of size 0) the name buffer is zeroed, *irlen is 0 and the
 * BYPASS buffer is filled with 0xFF bytes (no NUL).  Null outputs are
 * skipped. */
JEXJTAG_API uint32_t JexJtag_db_lookupDevice(unsigned handle, const char* idcode, char* deviceName,
                                             unsigned devicebuf_size, unsigned* irlen, char* cmd_bypass,
                                             unsigned bypassbuf_size);
/* The three lookups below call JexJtag_db_lookupDevice for one output each,
 * with the same buffer rules and statuses. */
JEXJTAG_API uint32_t JexJtag_db_getDeviceNameForIdcode(unsigned handle, const char* idcode,
                                                       char* deviceName, unsigned devicebuf_size);
JEXJTAG_API uint32_t JexJtag_db_getIRLengthForIdcode(unsigned handle, const char* idcode, unsigned* irlen);
JEXJTAG_API uint32_t JexJtag_db_getBypassForIdcode(unsigned handle, const char* idcode, char* cmd_bypass,
                                                   unsigned bypassbuf_size);

/* Reads a BSDL text held in memory: entity name, instruction length, IDCODE
 * register text (empty when the device has none) and the first BYPASS
 * opcode.  Output buffers are zeroed first; texts are cut to size - 1.
 * Warnings and errors go to the host as messages that name filename.  A
 * text larger than 64 MiB fails (nothing of it is copied). */
JEXJTAG_API uint32_t JexJtag_db_parseBSDL(unsigned handle, const char* filename, const char* buf,
                                          unsigned bufLen, char* deviceName, unsigned deviceNameLen,
                                          unsigned* irlength, char* idcode, unsigned idcodeLen,
                                          char* cmd_bypass, unsigned bypassbufLen);
/* The same for a BSDL file, read once from its start without seeking (a pipe
 * or FIFO works) and never beyond 64 MiB: a larger file fails.  A file that
 * cannot be opened or read fails, with an error message, without touching
 * the outputs. */
JEXJTAG_API uint32_t JexJtag_db_parseBSDLFile(unsigned handle, const char* filename, char* deviceName,
                                              unsigned deviceNameLen, unsigned* irlength, char* idcode,
                                              unsigned idcodeLen, char* cmd_bypass, unsigned bypassbufLen);

JEXJTAG_END_DECLS

#endif /* JEXJTAG_DB_H */
