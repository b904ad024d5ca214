// SPDX-License-Identifier: MIT
/*
 * A test module in C whose entry points can be left out one by one
 * (OMIT_CREATE, OMIT_DESTROY, OMIT_LOADED, OMIT_UNLOADED,
 * OMIT_SETCALLBACKS), or whose JexPlugin_create answers null (NULL_CREATE).
 * Every entry point it has records its call (tests/support/EntryLog.h).
 */
#include <stdlib.h>

#include "jexjtag/plugin.h"
#include "support/EntryLog.h"

#ifndef JEX_TEST_MODULE
#error "JEX_TEST_MODULE names the module"
#endif

static const JexPluginOps g_ops; /* every position null */

#ifndef OMIT_CREATE
JEXJTAG_PLUGIN_EXPORT JexPluginInstance* JexPlugin_create(void)
{
#ifdef NULL_CREATE
    jexTestEntryLog(JEX_TEST_MODULE, "create null");
    return NULL;
#else
    JexPluginInstance* instance = (JexPluginInstance*)malloc(sizeof *instance);
    if (instance) instance->ops = &g_ops;
    jexTestEntryLog(JEX_TEST_MODULE, "create");
    return instance;
#endif
}
#endif

#ifndef OMIT_DESTROY
JEXJTAG_PLUGIN_EXPORT uint32_t JexPlugin_destroy(JexPluginInstance* instance)
{
    jexTestEntryLog(JEX_TEST_MODULE, "destroy");
    free(instance);
    return JEX_SUCCESS;
}
#endif

#ifndef OMIT_LOADED
JEXJTAG_PLUGIN_EXPORT uint32_t JexPlugin_loaded(void)
{
    jexTestEntryLog(JEX_TEST_MODULE, "loaded");
    return JEX_SUCCESS;
}
#endif

#ifndef OMIT_UNLOADED
JEXJTAG_PLUGIN_EXPORT uint32_t JexPlugin_unloaded(void)
{
    jexTestEntryLog(JEX_TEST_MODULE, "unloaded");
    return JEX_SUCCESS;
}
#endif

#ifndef OMIT_SETCALLBACKS
JEXJTAG_PLUGIN_EXPORT uint32_t JexPlugin_setCallbacks(const JexPluginCallbacks* callbacks)
{
    (void)callbacks;
    jexTestEntryLog(JEX_TEST_MODULE, "setCallbacks");
    return JEX_SUCCESS;
}
#endif

/* Keeps the table referenced when create is left out. */
const JexPluginOps* partialPluginOps(void);
const JexPluginOps* partialPluginOps(void) { return &g_ops; }
