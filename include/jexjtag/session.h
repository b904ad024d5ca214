// SPDX-License-Identifier: MIT
/*
 * session.h - sessions, the target list and messages.
 *
 * A host creates a session first, passes its handle to every other call and
 * destroys it last.  Every function returns JEX_SUCCESS or JEX_FAILURE and
 * writes its results through out-parameters.  Calls on different sessions
 * may come from different threads at the same time; the calls on one
 * session (and its target) must come from one thread at a time.
 *
 * A message callback may call back into the library, also to destroy its
 * session, close its target or create sessions: what the running call uses
 * stays alive until it returns, and such a teardown completes then.  Once
 * destroyed, a session's handle reaches nothing and it gets no more
 * messages.  Sessions may be destroyed from atexit handlers and global
 * destructors.
 */
#ifndef JEXJTAG_SESSION_H
#define JEXJTAG_SESSION_H

#include "types.h"

JEXJTAG_BEGIN_DECLS

/* Writes the API version number to *version (when not null; also when the
 * call then fails) and "Version <text>" into versionString, which must hold
 * at least 128 bytes.  versionLen below 128: JEX_FAILURE.  A null
 * versionString with versionLen >= 128 succeeds and writes no text. */
JEXJTAG_API uint32_t JexJtag_session_getAPIVersion(unsigned* version, char* versionString,
                                                   unsigned versionLen);

/* Creates a session and writes its handle (0x00010000, 0x00020000, ...,
 * 0x00FF0000, then 0x00000000 for the 256th session, which is a valid
 * handle, and round again, skipping ids still in use).  argv holds argc
 * "key=value" texts: "datadir=DIR" chooses the directory of idcode.lst for
 * the whole process, "unloadtargetsondestroy=false" keeps plug-ins loaded
 * after the last session.  msgCallback may be null (messages then go to
 * stdout).  On failure *handle is 0 too: tell failure by the status, never
 * by the handle. */
JEXJTAG_API uint32_t JexJtag_session_create(JexMessageCallback msgCallback, unsigned argc,
                                            const char** argv, unsigned* handle);

/* Destroys the session (closing its target).  Unknown handle: JEX_FAILURE. */
JEXJTAG_API uint32_t JexJtag_session_destroy(unsigned handle);

/* Delivers text to the session's host as a message of msgType. */
JEXJTAG_API uint32_t JexJtag_session_sendMessage(unsigned handle, unsigned msgType,
                                                 const char* text);

/* Stores a plug-in search path for the host and refreshes the target list.
 * The plug-in tree that is walked is not changed by it. */
JEXJTAG_API uint32_t JexJtag_session_setPluginSearchPath(unsigned handle, const char* path);

/* Copies the stored path and its NUL into path; JEX_FAILURE (nothing
 * written) unless pathsize exceeds the path's length. */
JEXJTAG_API uint32_t JexJtag_session_getPluginSearchPath(unsigned handle, char* path,
                                                         unsigned pathsize);

/* Looks for plug-ins added to the plug-in tree since the last discovery. */
JEXJTAG_API uint32_t JexJtag_session_refreshTargetList(unsigned handle);

/* Number of target types the loaded plug-ins offer. */
JEXJTAG_API uint32_t JexJtag_session_getTargetCount(unsigned handle, unsigned* count);

/* Buffer size (descriptor size + 1) needed for the description of a target. */
JEXJTAG_API uint32_t JexJtag_session_getTargetXMLSizeByIndex(unsigned handle, unsigned targetIdx,
                                                             unsigned* xmlBufSize);

/* Fills xmlBuf with the target's descriptor text (cut to xmlBufLen - 1 and
 * NUL-terminated), targetName with its type name and pluginName with its
 * plug-in's name (each cut to its length - 1 and NUL-terminated). */
JEXJTAG_API uint32_t JexJtag_session_getTargetByIndex(unsigned handle, unsigned targetIdx,
                                                      char* xmlBuf, unsigned xmlBufLen,
                                                      char* targetName, unsigned targetNameLen,
                                                      char* pluginName, unsigned pluginNameLen);

JEXJTAG_END_DECLS

#endif /* JEXJTAG_SESSION_H */
