// SPDX-License-Identifier: MIT
/* A host written in C that knows the library only by file name: it dlopen()s
 * libJexJtag.so, resolves the session functions by name, and creates,
 * messages and destroys sessions. */
#include <dlfcn.h>
#include <stdio.h>
#include <string.h>

#include <jexjtag/jexjtag.h>

typedef uint32_t (*create_fn)(JexMessageCallback, unsigned, const char**, unsigned*);
typedef uint32_t (*destroy_fn)(unsigned);
typedef uint32_t (*send_fn)(unsigned, unsigned, const char*);
typedef uint32_t (*version_fn)(unsigned*, char*, unsigned);

static unsigned g_calls;
static unsigned g_lastHandle;
static char g_lastText[64];

static void onMessage(unsigned handle, unsigned type, const char* text)
{
    (void)type;
    ++g_calls;
    g_lastHandle = handle;
    strncpy(g_lastText, text, sizeof g_lastText - 1);
}

#define CHECK(cond)                                                  \
    do {                                                             \
        if (!(cond)) {                                               \
            fprintf(stderr, "dlopen_host: check failed: %s\n", #cond); \
            return 1;                                                \
        }                                                            \
    } while (0)

int main(int argc, char** argv)
{
    void* lib;
    create_fn create;
    destroy_fn destroy;
    send_fn send;
    version_fn version;
    unsigned first = 0, second = 0, number = 0;
    char text[128];

    CHECK(argc == 2);
    lib = dlopen(argv[1], RTLD_NOW | RTLD_LOCAL);
    CHECK(lib != NULL);
    *(void**)(&create) = dlsym(lib, "JexJtag_session_create");
    *(void**)(&destroy) = dlsym(lib, "JexJtag_session_destroy");
    *(void**)(&send) = dlsym(lib, "JexJtag_session_sendMessage");
    *(void**)(&version) = dlsym(lib, "JexJtag_session_getAPIVersion");
    CHECK(create && destroy && send && version);
    /* Internal symbols are hidden. */
    CHECK(dlsym(lib, "_ZN5JexRT11findSessionEj") == NULL);

    CHECK(version(&number, text, sizeof text) == JEX_SUCCESS);
    CHECK(number != 0 && strncmp(text, "Version ", 8) == 0);

    CHECK(create(onMessage, 0, NULL, &first) == JEX_SUCCESS);
    CHECK(create(onMessage, 0, NULL, &second) == JEX_SUCCESS);
    CHECK(first == 0x00010000u && second == 0x00020000u);
    CHECK(send(second | 0x0000FF00u, JEX_MSG_STATUS, "ready") == JEX_SUCCESS);
    CHECK(g_calls == 1 && g_lastHandle == second && strcmp(g_lastText, "ready") == 0);
    CHECK(destroy(first) == JEX_SUCCESS);
    CHECK(destroy(first) == JEX_FAILURE);
    CHECK(send(first, JEX_MSG_STATUS, "nobody") == JEX_FAILURE);
    CHECK(g_calls == 1);
    CHECK(destroy(second) == JEX_SUCCESS);
    CHECK(dlclose(lib) == 0);
    printf("dlopen_host: ok\n");
    return 0;
}
