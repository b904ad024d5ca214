/*
 * A plug-in written in plain C against jexjtag/plugin.h alone: a loopback
 * "cable" whose chain is a wire from TDI to TDO.
 *
 * It keeps the host callbacks it is given and answers the command "hello"
 * with an information message to the session that opened it.
 */
#include <stdlib.h>
#include <string.h>

#include "jexjtag/plugin.h"

typedef struct LoopbackInstance {
    JexPluginInstance base; /* first: the library reads the table from here */
    uint32_t session;
    int open;
} LoopbackInstance;

static JexPluginCallbacks g_host;

static LoopbackInstance* self_of(JexPluginInstance* self) { return (LoopbackInstance*)self; }

static uint32_t lb_open(JexPluginInstance* self, uint32_t argc, const char** argv, JexJtagCallContext* context)
{
    (void)argc;
    (void)argv;
    (void)context;
    self_of(self)->open = 1;
    return JEX_SUCCESS;
}

static uint32_t lb_close(JexPluginInstance* self)
{
    self_of(self)->open = 0;
    return JEX_SUCCESS;
}

static uint32_t lb_device_count(JexPluginInstance* self)
{
    (void)self;
    return 0;
}

static uint32_t lb_info(JexPluginInstance* self, JexJtagTargetInfo* info)
{
    (void)self;
    strcpy(info->target_name, "loopback");
    strcpy(info->plugin_name, "LoopbackPlugin");
    strcpy(info->vendor, "Example Co");
    return JEX_SUCCESS;
}

static uint32_t lb_session(JexPluginInstance* self, uint32_t handle)
{
    self_of(self)->session = handle;
    return JEX_SUCCESS;
}

static uint32_t lb_command(JexPluginInstance* self, const char* command, const uint8_t* in, uint32_t inLength,
                           uint8_t* out, uint32_t* outLength, JexJtagCallContext* context)
{
    (void)in;
    (void)inLength;
    (void)out;
    (void)context;
    if (outLength) *outLength = 0;
    if (!command || strcmp(command, "hello") != 0) return JEX_FAILURE;
    if (g_host.sendMessage) g_host.sendMessage(self_of(self)->session, JEX_MSG_INFO, "hello from C");
    return JEX_SUCCESS;
}

static uint32_t lb_shift_dr_rw(JexPluginInstance* self, const uint8_t* tdi, uint8_t* tdo, const uint8_t* tdiMask,
                               const uint8_t* tdoMask, uint32_t bitCount, uint32_t exitState,
                               JexJtagCallContext* context)
{
    (void)self;
    (void)tdiMask;
    (void)tdoMask;
    (void)exitState;
    (void)context;
    memcpy(tdo, tdi, (bitCount + 7u) / 8u);
    return JEX_SUCCESS;
}

static JexPluginOps g_ops;

JEXJTAG_PLUGIN_EXPORT JexPluginInstance* JexPlugin_create(void)
{
    LoopbackInstance* instance = (LoopbackInstance*)calloc(1, sizeof *instance);
    if (!instance) return NULL;
    instance->base.ops = &g_ops;
    return &instance->base;
}

JEXJTAG_PLUGIN_EXPORT uint32_t JexPlugin_destroy(JexPluginInstance* instance)
{
    free(instance);
    return JEX_SUCCESS;
}

JEXJTAG_PLUGIN_EXPORT uint32_t JexPlugin_loaded(void)
{
    g_ops.openTarget = lb_open;
    g_ops.closeTarget = lb_close;
    g_ops.getDeviceCount = lb_device_count;
    g_ops.getTargetInfo = lb_info;
    g_ops.setSessionHandle = lb_session;
    g_ops.sendCommand = lb_command;
    g_ops.shiftChainDRReadWrite = lb_shift_dr_rw;
    return JEX_SUCCESS;
}

JEXJTAG_PLUGIN_EXPORT uint32_t JexPlugin_unloaded(void)
{
    memset(&g_host, 0, sizeof g_host);
    return JEX_SUCCESS;
}

JEXJTAG_PLUGIN_EXPORT uint32_t JexPlugin_setCallbacks(const JexPluginCallbacks* callbacks)
{
    if (callbacks) g_host = *callbacks;
    return JEX_SUCCESS;
}
