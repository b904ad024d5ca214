// SPDX-License-Identifier: MIT
/*
 * tap.h - TAP navigation, register shifts and chain configuration.
 *
 * Bit buffers are in the plug-in's convention (the shipped plug-ins: bit i is
 * bit i%8 of byte i/8 and is shifted first).  The library copies no buffer
 * and computes no length.  A shift of 0 bits moves the TAP to exitState
 * instead, as JexJtag_tap_navigate(handle, exitState, 0, 0) would.
 *
 * shiftMode is read as two flags: bit 0 (JEXJTAG_SHIFT_READ) captures TDO
 * into tdobuf, bit 1 (JEXJTAG_SHIFT_WRITE) drives TDI from tdibuf; a
 * read-only shift holds TDI at the level of tdibuf's first byte (0 when
 * tdibuf is null).  A mode with neither bit fails without reaching the
 * plug-in.  States and modes are not checked: every value goes on.
 */
#ifndef JEXJTAG_TAP_H
#define JEXJTAG_TAP_H

#include "types.h"

JEXJTAG_BEGIN_DECLS

/* Interrogates the chain, then sets each device's IR length from the
 * session's device database (0 for devices it does not know). */
JEXJTAG_API uint32_t JexJtag_tap_autodetectChain(unsigned handle, unsigned algorithm);
/* Has the plug-in scan the chain for devices, IDCODEs and IR lengths. */
JEXJTAG_API uint32_t JexJtag_tap_interrogateChain(unsigned handle, unsigned algorithm);

/* The chain's device count as the plug-in keeps it; count must not be null. */
JEXJTAG_API uint32_t JexJtag_tap_getDeviceCount(unsigned handle, unsigned* count);
JEXJTAG_API uint32_t JexJtag_tap_setDeviceCount(unsigned handle, unsigned count);

/* Writes the device's BYPASS instruction as '1' characters (one per IR bit)
 * into bypassbuf, NUL-filled; no terminator when it fills the buffer. */
JEXJTAG_API uint32_t JexJtag_tap_getBypassCmd(unsigned handle, unsigned deviceIndex,
                                              char* bypassbuf, unsigned bypassbufLen);
/* Not supported: always JEX_FAILURE. */
JEXJTAG_API uint32_t JexJtag_tap_setBypassCmd(unsigned handle, unsigned deviceIndex,
                                              const char* cmd_bypass);

/* A device's IR length as the plug-in answers it; *irlen (not null) is set
 * to 0 first, also when the handle reaches no target. */
JEXJTAG_API uint32_t JexJtag_tap_getIRLength(unsigned handle, unsigned deviceIndex, unsigned* irlen);
JEXJTAG_API uint32_t JexJtag_tap_setIRLength(unsigned handle, unsigned deviceIndex, unsigned irlen);

/* Writes the device's IDCODE as 32 '0'/'1' characters, most significant bit
 * first, NUL-filled; no terminator when idcodeLen is 32 or less.  The buffer
 * is cleared first, also when the call fails. */
JEXJTAG_API uint32_t JexJtag_tap_getDeviceIdcode(unsigned handle, unsigned deviceIndex,
                                                 char* idcode, unsigned idcodeLen);
/* Overrides the device's IDCODE, given as 1 to 32 characters '0', '1', 'X'
 * or 'x' (an X bit is stored as 0; a shorter text has leading zeros); any
 * other text fails. */
JEXJTAG_API uint32_t JexJtag_tap_setDeviceIdcode(unsigned handle, unsigned deviceIndex,
                                                 const char* idcode);

/* Moves the TAP to newState with clockRepeat extra clocks there; with
 * microSeconds > 0 flushes and then waits at least microSeconds. */
JEXJTAG_API uint32_t JexJtag_tap_navigate(unsigned handle, unsigned newState, unsigned clockRepeat,
                                          unsigned microSeconds);

/* Shifts the instruction register of the whole chain. */
JEXJTAG_API uint32_t JexJtag_tap_shiftChainIR(unsigned handle, unsigned shiftMode, unsigned exitState,
                                              void* callerData, unsigned bitCount,
                                              const unsigned char* tdibuf, unsigned char* tdobuf,
                                              const unsigned char* tdimask, const unsigned char* tdomask);
/* Shifts the instruction register of one device; the plug-in addresses the
 * device (the library adds no bits for the others). */
JEXJTAG_API uint32_t JexJtag_tap_shiftDeviceIR(unsigned handle, unsigned deviceIndex, unsigned shiftMode,
                                               unsigned exitState, void* callerData, unsigned bitCount,
                                               const unsigned char* tdibuf, unsigned char* tdobuf,
                                               const unsigned char* tdimask, const unsigned char* tdomask);
/* Shifts the data register path of the whole chain. */
JEXJTAG_API uint32_t JexJtag_tap_shiftChainDR(unsigned handle, unsigned shiftMode, unsigned exitState,
                                              void* callerData, unsigned bitCount,
                                              const unsigned char* tdibuf, unsigned char* tdobuf,
                                              const unsigned char* tdimask, const unsigned char* tdomask);
/* Shifts the selected data register of one device. */
JEXJTAG_API uint32_t JexJtag_tap_shiftDeviceDR(unsigned handle, unsigned deviceIndex, unsigned shiftMode,
                                               unsigned exitState, void* callerData, unsigned bitCount,
                                               const unsigned char* tdibuf, unsigned char* tdobuf,
                                               const unsigned char* tdimask, const unsigned char* tdomask);

JEXJTAG_END_DECLS

#endif /* JEXJTAG_TAP_H */
