// SPDX-License-Identifier: MIT
/* demo_host - the smallest useful host of libJexJtag: creates a session,
 * prints the API version and the targets the installed plug-ins offer, and
 * destroys the session. */
#include <stdio.h>

#include <jexjtag/jexjtag.h>

static void onMessage(unsigned handle, unsigned type, const char* text)
{
    (void)handle;
    fprintf(stderr, "message 0x%x: %s\n", type, text);
}

int main(void)
{
    unsigned version = 0, handle = 0, count = 0, i;
    char text[128];

    if (JexJtag_session_getAPIVersion(&version, text, sizeof text) != JEX_SUCCESS) return 1;
    printf("libJexJtag %s (API 0x%X)\n", text, version);

    if (JexJtag_session_create(onMessage, 0, NULL, &handle) != JEX_SUCCESS) {
        fprintf(stderr, "demo_host: cannot create a session\n");
        return 1;
    }
    if (JexJtag_session_getTargetCount(handle, &count) != JEX_SUCCESS) count = 0;
    printf("targets: %u\n", count);
    for (i = 0; i < count; ++i) {
        char xml[4096], name[256], plugin[256];
        if (JexJtag_session_getTargetByIndex(handle, i, xml, sizeof xml, name, sizeof name, plugin,
                                             sizeof plugin) == JEX_SUCCESS)
            printf("  %u: %s (plug-in %s)\n", i, name, plugin);
    }
    JexJtag_session_destroy(handle);
    return 0;
}
