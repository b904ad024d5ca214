// SPDX-License-Identifier: MIT
/*
 * A plug-in written in plain C against jexjtag/plugin.h alone: a "cable"
 * that opens, closes, describes itself and keeps its session handle.
 */
#include <stdlib.h>
#include <string.h>

#include "jexjtag/plugin.h"

typedef struct LoopbackInstance {
    JexPluginInstance base; /* first: the library reads the table from here */
    uint32_t session;
    int open;
} LoopbackInstance;

static LoopbackInstance* self_of(JexPluginInstance* self) { return (LoopbackInstance*)self; }

static uint32_t lb_open(JexPluginInstance* self, uint32_t argc, const char** argv, JexJtagCallContext* context)
{
    (void)argc, (void)argv, (void)context;
    self_of(self)->open = 1;
    return JEX_SUCCESS;
}

static uint32_t lb_close(JexPluginInstance* self)
{
    self_of(self)->open = 0;
    return JEX_SUCCESS;
}

static uint32_t lb_info(JexPluginInstance* self, JexJtagTargetInfo* info)
{
    (void)self;
    strcpy(info->target_name, "loopback");
    strcpy(info->plugin_name, "LoopbackPlugin");
    return JEX_SUCCESS;
}

static uint32_t lb_session(JexPluginInstance* self, uint32_t handle)
{
    self_of(self)->session = handle;
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
    g_ops.getTargetInfo = lb_info;
    g_ops.setSessionHandle = lb_session;
    return JEX_SUCCESS;
}

JEXJTAG_PLUGIN_EXPORT uint32_t JexPlugin_unloaded(void) { return JEX_SUCCESS; }

JEXJTAG_PLUGIN_EXPORT uint32_t JexPlugin_setCallbacks(const JexPluginCallbacks* callbacks)
{
    (void)callbacks;
    return JEX_SUCCESS;
}
