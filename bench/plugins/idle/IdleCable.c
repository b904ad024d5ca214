// SPDX-License-Identifier: MIT
/*
 * IdleCable - a plug-in whose operations return at once, for measuring what
 * the library adds to a call.  Plain C against the public ABI header only.
 * It serves the target type "idle_cable".
 */
#include <stdlib.h>

#include "jexjtag/plugin.h"

static uint32_t idleOpen(JexPluginInstance* self, uint32_t argc, const char** argv, JexJtagCallContext* context)
{
    (void)self; (void)argc; (void)argv; (void)context;
    return JEX_SUCCESS;
}
static uint32_t idleNone(JexPluginInstance* self) { (void)self; return JEX_SUCCESS; }
static uint32_t idleOne(JexPluginInstance* self, uint32_t a) { (void)self; (void)a; return JEX_SUCCESS; }
static uint32_t idleTwo(JexPluginInstance* self, uint32_t a, uint32_t b)
{
    (void)self; (void)a; (void)b;
    return JEX_SUCCESS;
}
static uint32_t idleCount(JexPluginInstance* self) { (void)self; return 1; }
static int32_t idleIRLength(JexPluginInstance* self, uint32_t d) { (void)self; (void)d; return 6; }
static uint32_t idleIdcode(JexPluginInstance* self, uint32_t d) { (void)self; (void)d; return 0x0362D093u; }
static uint32_t idleInfo(JexPluginInstance* self, JexJtagTargetInfo* info) { (void)self; (void)info; return JEX_SUCCESS; }
static uint32_t idleRead(JexPluginInstance* self, bool level, uint8_t* tdo, const uint8_t* tdoMask, uint32_t n,
                         uint32_t exitState, JexJtagCallContext* context)
{
    (void)self; (void)level; (void)tdo; (void)tdoMask; (void)n; (void)exitState; (void)context;
    return JEX_SUCCESS;
}
static uint32_t idleWrite(JexPluginInstance* self, const uint8_t* tdi, const uint8_t* tdiMask, uint32_t n,
                          uint32_t exitState, JexJtagCallContext* context)
{
    (void)self; (void)tdi; (void)tdiMask; (void)n; (void)exitState; (void)context;
    return JEX_SUCCESS;
}
static uint32_t idleReadWrite(JexPluginInstance* self, const uint8_t* tdi, uint8_t* tdo, const uint8_t* tdiMask,
                              const uint8_t* tdoMask, uint32_t n, uint32_t exitState, JexJtagCallContext* context)
{
    (void)self; (void)tdi; (void)tdo; (void)tdiMask; (void)tdoMask; (void)n; (void)exitState; (void)context;
    return JEX_SUCCESS;
}
static uint32_t idleDeviceRead(JexPluginInstance* self, uint32_t d, bool level, uint8_t* tdo, const uint8_t* tdoMask,
                               uint32_t n, uint32_t exitState, JexJtagCallContext* context)
{
    (void)d;
    return idleRead(self, level, tdo, tdoMask, n, exitState, context);
}
static uint32_t idleDeviceWrite(JexPluginInstance* self, uint32_t d, const uint8_t* tdi, const uint8_t* tdiMask,
                                uint32_t n, uint32_t exitState, JexJtagCallContext* context)
{
    (void)d;
    return idleWrite(self, tdi, tdiMask, n, exitState, context);
}
static uint32_t idleDeviceReadWrite(JexPluginInstance* self, uint32_t d, const uint8_t* tdi, uint8_t* tdo,
                                    const uint8_t* tdiMask, const uint8_t* tdoMask, uint32_t n, uint32_t exitState,
                                    JexJtagCallContext* context)
{
    (void)d;
    return idleReadWrite(self, tdi, tdo, tdiMask, tdoMask, n, exitState, context);
}
static uint32_t idleGetPin(JexPluginInstance* self, uint32_t pin, uint32_t* value)
{
    (void)self; (void)pin;
    if (value) *value = 0;
    return JEX_SUCCESS;
}
static uint32_t idleCommand(JexPluginInstance* self, const char* command, const uint8_t* in, uint32_t inLength,
                            uint8_t* out, uint32_t* outLength, JexJtagCallContext* context)
{
    (void)self; (void)command; (void)in; (void)inLength; (void)out; (void)outLength; (void)context;
    return JEX_SUCCESS;
}

static const JexPluginOps kOps = {
    .openTarget = idleOpen,
    .closeTarget = idleNone,
    .interrogate = idleNone,
    .getDeviceCount = idleCount,
    .setDeviceCount = idleOne,
    .getIRLength = idleIRLength,
    .setIRLength = idleTwo,
    .getDeviceIdcode = idleIdcode,
    .setDeviceID = idleTwo,
    .getTargetInfo = idleInfo,
    .setSessionHandle = idleOne,
    .lockTarget = idleOne,
    .unlockTarget = idleNone,
    .cleanLocks = idleNone,
    .navigateTAP = idleTwo,
    .shiftChainIRRead = idleRead,
    .shiftChainIRWrite = idleWrite,
    .shiftChainIRReadWrite = idleReadWrite,
    .shiftChainDRRead = idleRead,
    .shiftChainDRWrite = idleWrite,
    .shiftChainDRReadWrite = idleReadWrite,
    .shiftDeviceIRRead = idleDeviceRead,
    .shiftDeviceIRWrite = idleDeviceWrite,
    .shiftDeviceIRReadWrite = idleDeviceReadWrite,
    .shiftDeviceDRRead = idleDeviceRead,
    .shiftDeviceDRWrite = idleDeviceWrite,
    .shiftDeviceDRReadWrite = idleDeviceReadWrite,
    .flush = idleNone,
    .setPin = idleTwo,
    .getPin = idleGetPin,
    .pulsePin = idleTwo,
    .waitTime = idleOne,
    .sendCommand = idleCommand,
};

JEXJTAG_PLUGIN_EXPORT JexPluginInstance* JexPlugin_create(void)
{
    JexPluginInstance* instance = malloc(sizeof *instance);
    if (instance) instance->ops = &kOps;
    return instance;
}

JEXJTAG_PLUGIN_EXPORT uint32_t JexPlugin_destroy(JexPluginInstance* instance)
{
    free(instance);
    return JEX_SUCCESS;
}

JEXJTAG_PLUGIN_EXPORT uint32_t JexPlugin_loaded(void) { return JEX_SUCCESS; }
JEXJTAG_PLUGIN_EXPORT uint32_t JexPlugin_unloaded(void) { return JEX_SUCCESS; }
JEXJTAG_PLUGIN_EXPORT uint32_t JexPlugin_setCallbacks(const JexPluginCallbacks* callbacks)
{
    (void)callbacks;
    return JEX_SUCCESS;
}
