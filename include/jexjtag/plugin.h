// SPDX-License-Identifier: MIT
/*
 * plugin.h - the plug-in ABI of libJexJtag.
 *
 * This header is its own stability tier: plug-in modules are built against
 * it alone.  It is plain C.
 *
 * A plug-in lives in <library dir>/plugins/<company>/<P>/ as P.so with its
 * descriptor P.xml:
 *
 *     <JexPlugin><targetname>my_cable</targetname></JexPlugin>
 *
 * The module exports the five entry points below with C linkage.  The
 * library calls JexPlugin_loaded, then JexPlugin_setCallbacks, then any
 * number of JexPlugin_create / JexPlugin_destroy pairs, then
 * JexPlugin_unloaded before it frees the module.
 *
 * An instance is a struct whose first member points to its operation table
 * (JexPluginOps).  Position N of the table is its N-th function pointer;
 * every operation takes the instance first.  Positions the library never
 * calls are reserved and may be null.
 *
 * Bit buffers: bit i of a buffer is bit (i % 8) of byte (i / 8); bit 0 is
 * shifted first (the bit nearest TDO leaves first).  A buffer for n bits
 * holds (n + 7) / 8 bytes.  The plug-ins shipped with the library follow
 * this order; the library itself never looks inside a buffer.
 *
 * Device index: the devices of a chain are counted from TDO.  Device 0 is
 * the device nearest TDO, whose IDCODE leaves first in a DR scan after
 * Test-Logic-Reset; the last device is the one whose TDI is the cable's TDI.
 * The plug-ins shipped with the library count so.
 *
 * Statuses are uint32_t, failure when bit 31 is set (JEX_FAILED).  No C++
 * exception may leave a plug-in call.
 */
#ifndef JEXJTAG_PLUGIN_H
#define JEXJTAG_PLUGIN_H

#include <stdarg.h>
#include <stdbool.h>
#include <stddef.h>
#include <stdint.h>

#include "types.h"

JEXJTAG_BEGIN_DECLS

/* ---- Host callbacks -------------------------------------------------------
 * Given to the module once through JexPlugin_setCallbacks.  The table itself
 * lives only for that call: copy what you keep.                              */
typedef struct JexPluginCallbacks {
    /* Delivers text to the host of the session with that handle (the one
     * received through setSessionHandle); dropped when no such session. */
    void (*sendMessage)(uint32_t sessionHandle, uint32_t msgType, const char* text);
    /* Writes one printf-style line to the library's log at level. */
    void (*vprintLog)(int level, const char* format, va_list args);
    /* Hex dump into the library's log; length is what the caller gives (bits for shift buffers). */
    void (*dumpBuffer)(int level, const char* label, const uint8_t* bytes, uint32_t length);
    /* Method entry and exit trace lines. */
    void (*logMethodEntry)(const char* name);
    void (*logMethodExit)(const char* name);
} JexPluginCallbacks;

JEXJTAG_STATIC_ASSERT(offsetof(JexPluginCallbacks, sendMessage) == 0 * sizeof(void (*)(void)),
                      "sendMessage is the first callback");
JEXJTAG_STATIC_ASSERT(offsetof(JexPluginCallbacks, vprintLog) == 1 * sizeof(void (*)(void)),
                      "vprintLog is the second callback");
JEXJTAG_STATIC_ASSERT(offsetof(JexPluginCallbacks, dumpBuffer) == 2 * sizeof(void (*)(void)),
                      "dumpBuffer is the third callback");
JEXJTAG_STATIC_ASSERT(offsetof(JexPluginCallbacks, logMethodEntry) == 3 * sizeof(void (*)(void)),
                      "logMethodEntry is the fourth callback");
JEXJTAG_STATIC_ASSERT(offsetof(JexPluginCallbacks, logMethodExit) == 4 * sizeof(void (*)(void)),
                      "logMethodExit is the fifth callback");
JEXJTAG_STATIC_ASSERT(sizeof(JexPluginCallbacks) == 5 * sizeof(void (*)(void)),
                      "JexPluginCallbacks holds five function pointers");

/* ---- Instances and their operation table ------------------------------------ */
typedef struct JexPluginInstance JexPluginInstance;
typedef struct JexPluginOps JexPluginOps;

struct JexPluginInstance {
    const JexPluginOps* ops; /* must be the first member */
};
JEXJTAG_STATIC_ASSERT(offsetof(JexPluginInstance, ops) == 0, "an instance starts with its operation table");

typedef void (*JexPluginReservedOp)(void);

struct JexPluginOps {
    JexPluginReservedOp reserved0[30];                                                    /* 0..29 */
    uint32_t (*openTarget)(JexPluginInstance* self, uint32_t argc, const char** argv,
                           JexJtagCallContext* context);                                  /* 30 */
    uint32_t (*closeTarget)(JexPluginInstance* self);                                     /* 31 */
    JexPluginReservedOp reserved32;                                                       /* 32 */
    uint32_t (*interrogate)(JexPluginInstance* self);                                     /* 33 */
    JexPluginReservedOp reserved34[2];                                                    /* 34, 35 */
    uint32_t (*getDeviceCount)(JexPluginInstance* self);           /* 36: the count itself */
    uint32_t (*setDeviceCount)(JexPluginInstance* self, uint32_t count);                  /* 37 */
    int32_t (*getIRLength)(JexPluginInstance* self, uint32_t deviceIndex); /* 38: the length */
    uint32_t (*setIRLength)(JexPluginInstance* self, uint32_t deviceIndex, uint32_t irLength); /* 39 */
    uint32_t (*getDeviceIdcode)(JexPluginInstance* self, uint32_t deviceIndex); /* 40: the IDCODE */
    uint32_t (*setDeviceID)(JexPluginInstance* self, uint32_t deviceIndex, uint32_t idcode); /* 41 */
    uint32_t (*getTargetInfo)(JexPluginInstance* self, JexJtagTargetInfo* info); /* 42: zeroed by caller */
    uint32_t (*setSessionHandle)(JexPluginInstance* self, uint32_t sessionHandle);        /* 43 */
    uint32_t (*lockTarget)(JexPluginInstance* self, uint32_t msWait);                     /* 44 */
    uint32_t (*unlockTarget)(JexPluginInstance* self);                                    /* 45 */
    uint32_t (*cleanLocks)(JexPluginInstance* self);                                      /* 46 */
    JexPluginReservedOp reserved47[3];                                                    /* 47..49 */
    uint32_t (*navigateTAP)(JexPluginInstance* self, uint32_t newState, uint32_t clockRepeat); /* 50 */

    uint32_t (*shiftChainIRRead)(JexPluginInstance* self, bool tdiLevel, uint8_t* tdo,
                                 const uint8_t* tdoMask, uint32_t bitCount, uint32_t exitState,
                                 JexJtagCallContext* context);                            /* 51 */
    uint32_t (*shiftChainIRWrite)(JexPluginInstance* self, const uint8_t* tdi, const uint8_t* tdiMask,
                                  uint32_t bitCount, uint32_t exitState,
                                  JexJtagCallContext* context);                           /* 52 */
    uint32_t (*shiftChainIRReadWrite)(JexPluginInstance* self, const uint8_t* tdi, uint8_t* tdo,
                                      const uint8_t* tdiMask, const uint8_t* tdoMask, uint32_t bitCount,
                                      uint32_t exitState, JexJtagCallContext* context);   /* 53 */
    uint32_t (*shiftChainDRRead)(JexPluginInstance* self, bool tdiLevel, uint8_t* tdo,
                                 const uint8_t* tdoMask, uint32_t bitCount, uint32_t exitState,
                                 JexJtagCallContext* context);                            /* 54 */
    uint32_t (*shiftChainDRWrite)(JexPluginInstance* self, const uint8_t* tdi, const uint8_t* tdiMask,
                                  uint32_t bitCount, uint32_t exitState,
                                  JexJtagCallContext* context);                           /* 55 */
    uint32_t (*shiftChainDRReadWrite)(JexPluginInstance* self, const uint8_t* tdi, uint8_t* tdo,
                                      const uint8_t* tdiMask, const uint8_t* tdoMask, uint32_t bitCount,
                                      uint32_t exitState, JexJtagCallContext* context);   /* 56 */
    uint32_t (*shiftDeviceIRRead)(JexPluginInstance* self, uint32_t deviceIndex, bool tdiLevel,
                                  uint8_t* tdo, const uint8_t* tdoMask, uint32_t bitCount,
                                  uint32_t exitState, JexJtagCallContext* context);       /* 57 */
    uint32_t (*shiftDeviceIRWrite)(JexPluginInstance* self, uint32_t deviceIndex, const uint8_t* tdi,
                                   const uint8_t* tdiMask, uint32_t bitCount, uint32_t exitState,
                                   JexJtagCallContext* context);                          /* 58 */
    uint32_t (*shiftDeviceIRReadWrite)(JexPluginInstance* self, uint32_t deviceIndex, const uint8_t* tdi,
                                       uint8_t* tdo, const uint8_t* tdiMask, const uint8_t* tdoMask,
                                       uint32_t bitCount, uint32_t exitState,
                                       JexJtagCallContext* context);                      /* 59 */
    uint32_t (*shiftDeviceDRRead)(JexPluginInstance* self, uint32_t deviceIndex, bool tdiLevel,
                                  uint8_t* tdo, const uint8_t* tdoMask, uint32_t bitCount,
                                  uint32_t exitState, JexJtagCallContext* context);       /* 60 */
    uint32_t (*shiftDeviceDRWrite)(JexPluginInstance* self, uint32_t deviceIndex, const uint8_t* tdi,
                                   const uint8_t* tdiMask, uint32_t bitCount, uint32_t exitState,
                                   JexJtagCallContext* context);                          /* 61 */
    uint32_t (*shiftDeviceDRReadWrite)(JexPluginInstance* self, uint32_t deviceIndex, const uint8_t* tdi,
                                       uint8_t* tdo, const uint8_t* tdiMask, const uint8_t* tdoMask,
                                       uint32_t bitCount, uint32_t exitState,
                                       JexJtagCallContext* context);                      /* 62 */
    uint32_t (*flush)(JexPluginInstance* self);                                           /* 63 */
    uint32_t (*setPin)(JexPluginInstance* self, uint32_t pin, uint32_t value);            /* 64 */
    uint32_t (*getPin)(JexPluginInstance* self, uint32_t pin, uint32_t* value);           /* 65 */
    uint32_t (*pulsePin)(JexPluginInstance* self, uint32_t pin, uint32_t count);          /* 66 */
    uint32_t (*waitTime)(JexPluginInstance* self, uint32_t microseconds);                 /* 67 */
    /* *outLength holds outBuffer's capacity on entry. */
    uint32_t (*sendCommand)(JexPluginInstance* self, const char* command, const uint8_t* inBuffer,
                            uint32_t inLength, uint8_t* outBuffer, uint32_t* outLength,
                            JexJtagCallContext* context);                                 /* 68 */
};

#define JEXJTAG_PLUGIN_OP_POSITION(op) (offsetof(JexPluginOps, op) / sizeof(JexPluginReservedOp))
#define JEXJTAG_PIN_OP(op, pos) \
    JEXJTAG_STATIC_ASSERT(JEXJTAG_PLUGIN_OP_POSITION(op) == (pos), "operation " #op " sits at " #pos)
JEXJTAG_STATIC_ASSERT(sizeof(void*) == sizeof(JexPluginReservedOp), "data and function pointers agree");
JEXJTAG_PIN_OP(openTarget, 30);
JEXJTAG_PIN_OP(closeTarget, 31);
JEXJTAG_PIN_OP(interrogate, 33);
JEXJTAG_PIN_OP(getDeviceCount, 36);
JEXJTAG_PIN_OP(setDeviceCount, 37);
JEXJTAG_PIN_OP(getIRLength, 38);
JEXJTAG_PIN_OP(setIRLength, 39);
JEXJTAG_PIN_OP(getDeviceIdcode, 40);
JEXJTAG_PIN_OP(setDeviceID, 41);
JEXJTAG_PIN_OP(getTargetInfo, 42);
JEXJTAG_PIN_OP(setSessionHandle, 43);
JEXJTAG_PIN_OP(lockTarget, 44);
JEXJTAG_PIN_OP(unlockTarget, 45);
JEXJTAG_PIN_OP(cleanLocks, 46);
JEXJTAG_PIN_OP(navigateTAP, 50);
JEXJTAG_PIN_OP(shiftChainIRRead, 51);
JEXJTAG_PIN_OP(shiftChainIRWrite, 52);
JEXJTAG_PIN_OP(shiftChainIRReadWrite, 53);
JEXJTAG_PIN_OP(shiftChainDRRead, 54);
JEXJTAG_PIN_OP(shiftChainDRWrite, 55);
JEXJTAG_PIN_OP(shiftChainDRReadWrite, 56);
JEXJTAG_PIN_OP(shiftDeviceIRRead, 57);
JEXJTAG_PIN_OP(shiftDeviceIRWrite, 58);
JEXJTAG_PIN_OP(shiftDeviceIRReadWrite, 59);
JEXJTAG_PIN_OP(shiftDeviceDRRead, 60);
JEXJTAG_PIN_OP(shiftDeviceDRWrite, 61);
JEXJTAG_PIN_OP(shiftDeviceDRReadWrite, 62);
JEXJTAG_PIN_OP(flush, 63);
JEXJTAG_PIN_OP(setPin, 64);
JEXJTAG_PIN_OP(getPin, 65);
JEXJTAG_PIN_OP(pulsePin, 66);
JEXJTAG_PIN_OP(waitTime, 67);
JEXJTAG_PIN_OP(sendCommand, 68);
JEXJTAG_STATIC_ASSERT(sizeof(JexPluginOps) == 69 * sizeof(JexPluginReservedOp),
                      "the operation table has 69 positions");

/* ---- Module entry points --------------------------------------------------------
 * All five are required: a module lacking any one is refused (and, if it has
 * JexPlugin_unloaded, that one is still called before the module is freed).
 * Results other than JexPlugin_create's are not looked at by the library.
 *
 *   JexPlugin_create       a new instance for one of the module's target
 *                          types, or null; the type arrives later as the
 *                          last open argument, "type=<name>".
 *   JexPlugin_destroy      gives back an instance that create returned.
 *                          Never called for a null instance from create,
 *                          and never at unload.
 *   JexPlugin_loaded       once, right after the module is loaded.
 *   JexPlugin_setCallbacks once, right after JexPlugin_loaded.
 *   JexPlugin_unloaded     once, just before the module is freed.          */
typedef JexPluginInstance* (*JexPlugin_create_fn)(void);
typedef uint32_t (*JexPlugin_destroy_fn)(JexPluginInstance* instance);
typedef uint32_t (*JexPlugin_loaded_fn)(void);
typedef uint32_t (*JexPlugin_unloaded_fn)(void);
typedef uint32_t (*JexPlugin_setCallbacks_fn)(const JexPluginCallbacks* callbacks);

/* Prototypes a module implements (and exports with JEXJTAG_PLUGIN_EXPORT). */
JEXJTAG_PLUGIN_EXPORT JexPluginInstance* JexPlugin_create(void);
JEXJTAG_PLUGIN_EXPORT uint32_t JexPlugin_destroy(JexPluginInstance* instance);
JEXJTAG_PLUGIN_EXPORT uint32_t JexPlugin_loaded(void);
JEXJTAG_PLUGIN_EXPORT uint32_t JexPlugin_unloaded(void);
JEXJTAG_PLUGIN_EXPORT uint32_t JexPlugin_setCallbacks(const JexPluginCallbacks* callbacks);

JEXJTAG_END_DECLS

#endif /* JEXJTAG_PLUGIN_H */
