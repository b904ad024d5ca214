// SPDX-License-Identifier: MIT
/*
 * jexjtag.h - the C API of libJexJtag.
 *
 * The usual road: JexJtag_session_create, list the targets
 * (JexJtag_session_getTargetCount / _getTargetByIndex), JexJtag_target_open,
 * JexJtag_target_lock, JexJtag_tap_autodetectChain, device shifts,
 * JexJtag_target_unlock, JexJtag_target_close, JexJtag_session_destroy.
 *
 * Log output is controlled by JEXJTAG_LOG_LEVEL (0 = off .. 5) and
 * JEXJTAG_LOG_FILE (default: standard error).
 */
#ifndef JEXJTAG_JEXJTAG_H
#define JEXJTAG_JEXJTAG_H

#include "types.h"
#include "session.h"
#include "target.h"
#include "tap.h"
#include "db.h"
#include "bsdl.h"
#include "svf.h"

#endif /* JEXJTAG_JEXJTAG_H */
