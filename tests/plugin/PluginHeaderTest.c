/*
 * plugin.h seen by a C compiler (-std=c11 -pedantic-errors -Werror): it
 * compiles, its static assertions hold, and a table filled by field name
 * puts each operation at its position.
 */
#include <stdio.h>
#include <string.h>

#include "jexjtag/jexjtag.h"
#include "jexjtag/plugin.h"

static uint32_t open_op(JexPluginInstance* self, uint32_t argc, const char** argv, JexJtagCallContext* context)
{
    (void)self, (void)argc, (void)argv, (void)context;
    return JEX_SUCCESS;
}

static uint32_t command_op(JexPluginInstance* self, const char* command, const uint8_t* in, uint32_t inLength,
                           uint8_t* out, uint32_t* outLength, JexJtagCallContext* context)
{
    (void)self, (void)command, (void)in, (void)inLength, (void)out, (void)outLength, (void)context;
    return JEX_SUCCESS;
}

static void send_message(uint32_t handle, uint32_t type, const char* text)
{
    (void)handle, (void)type, (void)text;
}

int main(void)
{
    JexPluginOps ops;
    JexPluginReservedOp slots[69];
    JexPluginCallbacks callbacks;
    JexPluginReservedOp cbSlots[5];
    int failures = 0;
    size_t i;

    memset(&ops, 0, sizeof ops);
    ops.openTarget = open_op;
    ops.sendCommand = command_op;
    memcpy(slots, &ops, sizeof slots);
    for (i = 0; i < 69; ++i) {
        const int expectSet = (i == 30 || i == 68);
        if ((slots[i] != NULL) != expectSet) {
            fprintf(stderr, "position %u is %s\n", (unsigned)i, slots[i] ? "set" : "empty");
            ++failures;
        }
    }
    if (slots[30] != (JexPluginReservedOp)open_op || slots[68] != (JexPluginReservedOp)command_op) {
        fprintf(stderr, "operations landed in the wrong positions\n");
        ++failures;
    }

    memset(&callbacks, 0, sizeof callbacks);
    callbacks.sendMessage = send_message;
    memcpy(cbSlots, &callbacks, sizeof cbSlots);
    if (cbSlots[0] != (JexPluginReservedOp)send_message) {
        fprintf(stderr, "sendMessage is not the first callback\n");
        ++failures;
    }
    if (sizeof(JexJtagTargetInfo) != 11268u || sizeof(JexJtagCallContext) != 16u) {
        fprintf(stderr, "record sizes differ\n");
        ++failures;
    }
    return failures ? 1 : 0;
}
