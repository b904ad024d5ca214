// SPDX-License-Identifier: MIT
/*
 * A fast remote_bitbang server for the network benchmarks, independent of
 * the library: its own TAP model (one device, IDCODE 0x4BA00477, IR length
 * 4; IDCODE opcode 0xE, every other opcode selects BYPASS), requests read in
 * large blocks and the replies of a block sent with one send().
 *
 *   rbb_bench_server [--socket PATH]
 *
 * Listens on 127.0.0.1 with a free port (or on the Unix socket PATH), prints
 * "listening on 127.0.0.1:PORT" (or "listening on PATH") and serves clients
 * one after another until it is killed.
 */
#define _GNU_SOURCE
#include <netinet/in.h>
#include <netinet/tcp.h>
#include <stdint.h>
#include <stdio.h>
#include <string.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

enum { TLR, IDLE, SEL_DR, CAP_DR, SHIFT_DR, EXIT1_DR, PAUSE_DR, EXIT2_DR, UPD_DR,
       SEL_IR, CAP_IR, SHIFT_IR, EXIT1_IR, PAUSE_IR, EXIT2_IR, UPD_IR };

static const uint8_t kNext[16][2] = {
    {IDLE, TLR},          {IDLE, SEL_DR},      {CAP_DR, SEL_IR},   {SHIFT_DR, EXIT1_DR},
    {SHIFT_DR, EXIT1_DR}, {PAUSE_DR, UPD_DR},  {PAUSE_DR, EXIT2_DR}, {SHIFT_DR, UPD_DR},
    {IDLE, SEL_DR},       {CAP_IR, TLR},       {SHIFT_IR, EXIT1_IR}, {SHIFT_IR, EXIT1_IR},
    {PAUSE_IR, UPD_IR},   {PAUSE_IR, EXIT2_IR}, {SHIFT_IR, UPD_IR}, {IDLE, SEL_DR}};

#define IDCODE_VALUE 0x4BA00477u
#define IR_LENGTH 4
#define IR_IDCODE 0xEu

struct tap {
    int state, tck, tdo;
    uint32_t ir;
    uint64_t reg; /* the selected shift register, LSB next out */
    int len;
};

static void tap_reset(struct tap* t)
{
    t->state = TLR;
    t->ir = IR_IDCODE;
}

static void tap_write(struct tap* t, int v)
{
    const int tck = (v >> 2) & 1, tms = (v >> 1) & 1, tdi = v & 1;
    if (tck && !t->tck) {
        const int s = t->state;
        if (s == SHIFT_DR || s == SHIFT_IR)
            t->reg = (t->reg >> 1) | ((uint64_t)tdi << (t->len - 1));
        const int n = kNext[s][tms];
        if (n == CAP_IR) {
            t->reg = 1;
            t->len = IR_LENGTH;
        } else if (n == CAP_DR) {
            if (t->ir == IR_IDCODE) {
                t->reg = IDCODE_VALUE;
                t->len = 32;
            } else {
                t->reg = 0;
                t->len = 1;
            }
        } else if (n == UPD_IR) {
            t->ir = (uint32_t)t->reg & ((1u << IR_LENGTH) - 1);
        } else if (n == TLR) {
            t->ir = IR_IDCODE;
        }
        t->state = n;
    } else if (!tck && t->tck) {
        t->tdo = (t->state == SHIFT_DR || t->state == SHIFT_IR) ? (int)(t->reg & 1) : 1;
    }
    t->tck = tck;
}

static int send_all(int fd, const char* data, size_t size)
{
    while (size > 0) {
        const ssize_t n = send(fd, data, size, MSG_NOSIGNAL);
        if (n <= 0) return -1;
        data += n;
        size -= (size_t)n;
    }
    return 0;
}

static void serve(int fd, struct tap* t)
{
    static char in[1 << 18];
    static char out[1 << 18];
    for (;;) {
        const ssize_t n = recv(fd, in, sizeof in, 0);
        if (n <= 0) return;
        size_t replies = 0;
        for (ssize_t i = 0; i < n; ++i) {
            /* Fast path: read-write bits in a Shift state ("0R4" / "1R5"),
             * exactly what the per-byte model below would do. */
            if ((t->state == SHIFT_DR || t->state == SHIFT_IR) && t->tck) {
                while (i + 2 < n && (in[i] == '0' || in[i] == '1') && in[i + 1] == 'R' && in[i + 2] == in[i] + 4) {
                    t->tdo = (int)(t->reg & 1);
                    out[replies++] = (char)('0' + t->tdo);
                    t->reg = (t->reg >> 1) | ((uint64_t)(in[i] - '0') << (t->len - 1));
                    i += 3;
                }
                if (i >= n) break;
            }
            const char c = in[i];
            if (c >= '0' && c <= '7') {
                tap_write(t, c - '0');
            } else if (c == 'R') {
                out[replies++] = (char)('0' + t->tdo);
            } else if (c == 'Q') {
                send_all(fd, out, replies);
                return;
            } else if (c >= 'r' && c <= 'u') {
                if ((c - 'r') & 2) tap_reset(t);
            }
        }
        if (replies && send_all(fd, out, replies) < 0) return;
    }
}

int main(int argc, char** argv)
{
    const char* path = (argc == 3 && strcmp(argv[1], "--socket") == 0) ? argv[2] : NULL;
    int server;
    if (path) {
        struct sockaddr_un addr;
        memset(&addr, 0, sizeof addr);
        addr.sun_family = AF_UNIX;
        strncpy(addr.sun_path, path, sizeof addr.sun_path - 1);
        server = socket(AF_UNIX, SOCK_STREAM, 0);
        if (server < 0 || bind(server, (struct sockaddr*)&addr, sizeof addr) < 0 || listen(server, 4) < 0) {
            perror("rbb_bench_server");
            return 1;
        }
        printf("listening on %s\n", path);
    } else {
        struct sockaddr_in addr;
        socklen_t size = sizeof addr;
        memset(&addr, 0, sizeof addr);
        addr.sin_family = AF_INET;
        addr.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
        server = socket(AF_INET, SOCK_STREAM, 0);
        if (server < 0 || bind(server, (struct sockaddr*)&addr, sizeof addr) < 0 || listen(server, 4) < 0 ||
            getsockname(server, (struct sockaddr*)&addr, &size) < 0) {
            perror("rbb_bench_server");
            return 1;
        }
        printf("listening on 127.0.0.1:%u\n", (unsigned)ntohs(addr.sin_port));
    }
    fflush(stdout);
    struct tap t;
    memset(&t, 0, sizeof t);
    tap_reset(&t);
    t.tdo = 1;
    for (;;) {
        const int fd = accept(server, NULL, NULL);
        if (fd < 0) continue;
        const int one = 1;
        if (!path) setsockopt(fd, IPPROTO_TCP, TCP_NODELAY, &one, sizeof one);
        serve(fd, &t);
        close(fd);
        t.tck = 0;
    }
}
