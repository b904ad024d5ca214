/* SPDX-License-Identifier: MIT */
/* consumer - prints the API version, the target types of the installed
 * plug-ins and one device of the installed device list; exits 1 when the
 * installation lacks any of them. */
#include <stdio.h>
#include <string.h>

#include <jexjtag/jexjtag.h>

int main(void)
{
    unsigned version = 0, handle = 0, count = 0, irlen = 0, i;
    char text[128], name[256];
    int found = 0;

    if (JexJtag_session_getAPIVersion(&version, text, sizeof text) != JEX_SUCCESS) return 1;
    printf("libJexJtag %s\n", text);
    if (JexJtag_session_create(NULL, 0, NULL, &handle) != JEX_SUCCESS) return 1;
    if (JexJtag_session_getTargetCount(handle, &count) != JEX_SUCCESS) count = 0;
    for (i = 0; i < count; ++i) {
        char xml[1], target[256], plugin[256];
        if (JexJtag_session_getTargetByIndex(handle, i, xml, sizeof xml, target, sizeof target, plugin,
                                             sizeof plugin) == JEX_SUCCESS) {
            printf("target %s\n", target);
            found |= strcmp(target, "jtag_sim") == 0;
        }
    }
    /* Xilinx XC7A35T, 0x0362D093 */
    JexJtag_db_lookupDevice(handle, "00000011011000101101000010010011", name, sizeof name, &irlen, NULL, 0);
    printf("0x0362D093 %s %u\n", name, irlen);
    JexJtag_session_destroy(handle);
    return found && irlen == 6 ? 0 : 1;
}
