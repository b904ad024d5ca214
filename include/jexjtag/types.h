// SPDX-License-Identifier: MIT
/*
 * types.h - statuses, handles, message types and the records and
 * enumerations shared by the C API and the plug-in ABI.
 *
 * Plain C; included by every other public header.
 */
#ifndef JEXJTAG_TYPES_H
#define JEXJTAG_TYPES_H

#include <stddef.h>
#include <stdint.h>

#include "export.h"

#ifdef __cplusplus
#  define JEXJTAG_STATIC_ASSERT(cond, msg) static_assert(cond, msg)
#else
#  define JEXJTAG_STATIC_ASSERT(cond, msg) _Static_assert(cond, msg)
#endif

/* ---- Status ------------------------------------------------------------
 * Every exported function returns a 32-bit status.  Any value with bit 31
 * set is a failure; traces print such a value as "JEX_FAILURE".          */
typedef uint32_t JexStatus;
#define JEX_SUCCESS 0x00000000u
#define JEX_FAILURE 0x80000000u
#define JEX_FAILED(status) (((status) & 0x80000000u) != 0u)

/* ---- Handles -----------------------------------------------------------
 * Bits 16..23 hold the session id, bits 0..7 the target index (only 0
 * exists); all other bits are ignored.  A target's handle is the handle
 * of its session.                                                         */
#define JEX_HANDLE_SESSION_MASK 0x00FF0000u
#define JEX_HANDLE_TARGET_MASK  0x000000FFu
#define JEX_HANDLE_SESSION_STEP 0x00010000u

/* ---- Messages ----------------------------------------------------------
 * Types of the messages delivered to the host's callback.  Values other
 * than these are debug types and are passed through unchanged.           */
#define JEX_MSG_ERROR   0x100u
#define JEX_MSG_WARNING 0x200u
#define JEX_MSG_STATUS  0x300u
#define JEX_MSG_INFO    0x400u
#define JEX_MSG_NOISE   0x500u
#define JEX_MSG_SILENT  0x8000u

/* The host's message callback.  `handle` is the session's own handle,
 * `text` is valid only during the call.  Runs on the calling thread,
 * inside the library call that raised the message. */
typedef void (*JexMessageCallback)(unsigned handle, unsigned msgType, const char* text);

/* ---- TAP states (IEEE 1149.1) ------------------------------------------ */
typedef enum JexJtagTapState {
    JEXJTAG_TEST_LOGIC_RESET = 0,
    JEXJTAG_RUN_TEST_IDLE    = 1,
    JEXJTAG_SELECT_DR_SCAN   = 2,
    JEXJTAG_CAPTURE_DR       = 3,
    JEXJTAG_SHIFT_DR         = 4,
    JEXJTAG_EXIT1_DR         = 5,
    JEXJTAG_PAUSE_DR         = 6,
    JEXJTAG_EXIT2_DR         = 7,
    JEXJTAG_UPDATE_DR        = 8,
    JEXJTAG_SELECT_IR_SCAN   = 9,
    JEXJTAG_CAPTURE_IR       = 10,
    JEXJTAG_SHIFT_IR         = 11,
    JEXJTAG_EXIT1_IR         = 12,
    JEXJTAG_PAUSE_IR         = 13,
    JEXJTAG_EXIT2_IR         = 14,
    JEXJTAG_UPDATE_IR        = 15,
    JEXJTAG_STATE_SIZE       = 16  /* number of states, not a state */
} JexJtagTapState;

/* ---- Shift modes: bit 0 captures TDO, bit 1 drives TDI ----------------- */
typedef enum JexJtagShiftMode {
    JEXJTAG_SHIFT_READ      = 1,
    JEXJTAG_SHIFT_WRITE     = 2,
    JEXJTAG_SHIFT_READWRITE = 3
} JexJtagShiftMode;

/* ---- Pins ---------------------------------------------------------------- */
typedef enum JexJtagPin {
    JEXJTAG_TDI = 0,
    JEXJTAG_TDO = 1,
    JEXJTAG_TMS = 2,
    JEXJTAG_TCK = 3
} JexJtagPin;

/* ---- Chain scan algorithms (traced, not passed to the plug-in) ------------ */
typedef enum JexJtagScanAlgorithm {
    JEXJTAG_SCAN_DEFAULT      = 0,
    JEXJTAG_SCAN_TLRSHIFT     = 1,
    JEXJTAG_SCAN_WALKING_ONES = 2
} JexJtagScanAlgorithm;

/* ---- Lock status ----------------------------------------------------------- */
typedef enum JexJtagLockStatus {
    JEXJTAG_NOTARGET     = 0,
    JEXJTAG_LOCKED_OTHER = 1,
    JEXJTAG_LOCKED_ME    = 2,
    JEXJTAG_UNLOCKED     = 3
} JexJtagLockStatus;

/* ---- Call context ---------------------------------------------------------
 * Built by the open, send-command and shift functions from their handle and
 * `callerData` argument and handed to the plug-in by pointer (to a copy
 * that lives for the call).  When the library issues a command itself
 * (option get/set) both fields are 0.                                       */
typedef struct JexJtagCallContext {
    uint32_t handle;      /* the handle the host passed in */
    uint32_t reserved;    /* not set; no meaning */
    void*    callerData;  /* the host's value, handed on unchanged */
} JexJtagCallContext;

JEXJTAG_STATIC_ASSERT(offsetof(JexJtagCallContext, handle) == 0, "JexJtagCallContext.handle");
JEXJTAG_STATIC_ASSERT(offsetof(JexJtagCallContext, reserved) == 4, "JexJtagCallContext.reserved");
JEXJTAG_STATIC_ASSERT(offsetof(JexJtagCallContext, callerData) == 8, "JexJtagCallContext.callerData");
JEXJTAG_STATIC_ASSERT(sizeof(void*) != 8 || sizeof(JexJtagCallContext) == 16, "JexJtagCallContext is 16 bytes");

/* ---- Target information ------------------------------------------------------
 * Filled by the plug-in's getTargetInfo, copied unchanged to the host.  Each
 * text is NUL-terminated within its 1024 bytes.                               */
#define JEXJTAG_INFO_TEXT_SIZE 1024
#define JEXJTAG_FLAG_NEW_FIRMWARE 0x1u /* target_flags bit 0: new firmware available */

typedef struct JexJtagTargetInfo {
    char     target_name[JEXJTAG_INFO_TEXT_SIZE];
    char     plugin_name[JEXJTAG_INFO_TEXT_SIZE];
    char     fw_ver[JEXJTAG_INFO_TEXT_SIZE];
    char     driver_ver[JEXJTAG_INFO_TEXT_SIZE];
    char     plugin_ver[JEXJTAG_INFO_TEXT_SIZE];
    char     vendor[JEXJTAG_INFO_TEXT_SIZE];
    char     frequency[JEXJTAG_INFO_TEXT_SIZE];
    char     port[JEXJTAG_INFO_TEXT_SIZE];
    char     full_name[JEXJTAG_INFO_TEXT_SIZE];
    char     target_uid[JEXJTAG_INFO_TEXT_SIZE];
    char     rawinfo[JEXJTAG_INFO_TEXT_SIZE];
    uint32_t target_flags;
} JexJtagTargetInfo;

JEXJTAG_STATIC_ASSERT(offsetof(JexJtagTargetInfo, target_name) == 0, "target_name");
JEXJTAG_STATIC_ASSERT(offsetof(JexJtagTargetInfo, plugin_name) == 1024, "plugin_name");
JEXJTAG_STATIC_ASSERT(offsetof(JexJtagTargetInfo, fw_ver) == 2048, "fw_ver");
JEXJTAG_STATIC_ASSERT(offsetof(JexJtagTargetInfo, driver_ver) == 3072, "driver_ver");
JEXJTAG_STATIC_ASSERT(offsetof(JexJtagTargetInfo, plugin_ver) == 4096, "plugin_ver");
JEXJTAG_STATIC_ASSERT(offsetof(JexJtagTargetInfo, vendor) == 5120, "vendor");
JEXJTAG_STATIC_ASSERT(offsetof(JexJtagTargetInfo, frequency) == 6144, "frequency");
JEXJTAG_STATIC_ASSERT(offsetof(JexJtagTargetInfo, port) == 7168, "port");
JEXJTAG_STATIC_ASSERT(offsetof(JexJtagTargetInfo, full_name) == 8192, "full_name");
JEXJTAG_STATIC_ASSERT(offsetof(JexJtagTargetInfo, target_uid) == 9216, "target_uid");
JEXJTAG_STATIC_ASSERT(offsetof(JexJtagTargetInfo, rawinfo) == 10240, "rawinfo");
JEXJTAG_STATIC_ASSERT(offsetof(JexJtagTargetInfo, target_flags) == 11264, "target_flags");
JEXJTAG_STATIC_ASSERT(sizeof(JexJtagTargetInfo) == 11268, "JexJtagTargetInfo is 11,268 bytes");

#endif /* JEXJTAG_TYPES_H */
