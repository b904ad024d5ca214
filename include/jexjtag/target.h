// SPDX-License-Identifier: MIT
/*
 * target.h - opening, closing, commanding and locking a session's target.
 *
 * A session has at most one target; it is addressed by the session's handle.
 * A handle without an open target gives JEX_FAILURE everywhere.
 */
#ifndef JEXJTAG_TARGET_H
#define JEXJTAG_TARGET_H

#include "types.h"

JEXJTAG_BEGIN_DECLS

/* Opens a target of type targetName through the plug-in that serves it.
 * handle is a session handle with a low byte of 0.  argv holds argc
 * "key=value" texts handed to the plug-in, followed by "type=<targetName>";
 * callerData reaches the plug-in unchanged.  "AVOID_FIRMWARE_UPDATE=true"
 * closes the target again (still returning success) when the plug-in reports
 * new firmware.  info, when not null, receives the target information record.
 * Opening while a target is open fails and closes the open one.  A null
 * targetName, or a null argv (entry) within argc, fails. */
JEXJTAG_API uint32_t JexJtag_target_open(unsigned handle, const char* targetName, void* callerData,
                                         unsigned argc, const char** argv, JexJtagTargetInfo* info);

/* Closes the target and gives its plug-in instance back; the status is the
 * plug-in's, but the target is gone either way.  A lock this process holds
 * is not released first. */
JEXJTAG_API uint32_t JexJtag_target_close(unsigned handle);

/* Passes a free-form command to the plug-in.  *outbuflen holds the capacity
 * of outbuf on entry; the plug-in may change it.  cmd must not be null. */
JEXJTAG_API uint32_t JexJtag_target_sendCommand(unsigned handle, const char* cmd,
                                                const unsigned char* inbuf, unsigned inbuflen,
                                                unsigned char* outbuf, unsigned* outbuflen,
                                                void* callerData);

/* Sets a plug-in option (sent as the command "set" with "key=value").  key
 * and value must not be null. */
JEXJTAG_API uint32_t JexJtag_target_setOption(unsigned handle, const char* key, const char* value);

/* Reads a plug-in option into value.  *valuesize holds value's capacity (at
 * least 1) on entry; the text is cut to capacity - 1 characters and
 * NUL-terminated, and *valuesize receives the option's full length, so a
 * caller can retry with a larger buffer. */
JEXJTAG_API uint32_t JexJtag_target_getOption(unsigned handle, const char* key, char* value,
                                              unsigned* valuesize);

/* Asks the plug-in for the cross-process cable lock, waiting up to msWait
 * milliseconds; *status (not null) receives the lock status afterwards.
 * Fails without asking the plug-in while this process holds the lock. */
JEXJTAG_API uint32_t JexJtag_target_lock(unsigned handle, unsigned msWait, unsigned* status);

/* Releases a lock this process holds; fails when it holds none. */
JEXJTAG_API uint32_t JexJtag_target_unlock(unsigned handle);

/* *status (not null) = JEXJTAG_LOCKED_ME or JEXJTAG_UNLOCKED for this
 * process; untouched when the handle reaches no target (JEX_FAILURE). */
JEXJTAG_API uint32_t JexJtag_target_getLockStatus(unsigned handle, unsigned* status);

/* Removes stale locks of the USB cable type ("ormund_usbcable") through a
 * temporary plug-in instance; fails, with an error message to the host,
 * while the session has a target. */
JEXJTAG_API uint32_t JexJtag_target_cleanLocks(unsigned handle);

/* Has the plug-in send what it has queued to the cable. */
JEXJTAG_API uint32_t JexJtag_target_flush(unsigned handle);
/* Pin operations; pins are JexJtagPin values, other values are passed on.
 * getPin writes *value (not null). */
JEXJTAG_API uint32_t JexJtag_target_setPin(unsigned handle, unsigned pin, unsigned value);
JEXJTAG_API uint32_t JexJtag_target_getPin(unsigned handle, unsigned pin, unsigned* value);
JEXJTAG_API uint32_t JexJtag_target_pulsePin(unsigned handle, unsigned pin, unsigned count);

/* Has the plug-in wait `us` microseconds on the cable. */
JEXJTAG_API uint32_t JexJtag_target_waitTime(unsigned handle, unsigned us);

/* Copies the target information record into *info (must not be null). */
JEXJTAG_API uint32_t JexJtag_target_getInfo(unsigned handle, JexJtagTargetInfo* info);

JEXJTAG_END_DECLS

#endif /* JEXJTAG_TARGET_H */
