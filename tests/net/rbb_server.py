# SPDX-License-Identifier: MIT
"""A small remote_bitbang server for the network cable tests.

Written apart from the client under test: its own TAP model (IEEE 1149.1
state machine, TDO changing on the falling TCK edge) and a chain of devices
with an IDCODE or only BYPASS.  Device 0 is the one nearest TDO.

    rbb_server.py [--chain ID:IRLEN[,...]] [--socket PATH]
                  [--fault die|mute|garbage --after N]

ID is a hexadecimal IDCODE or "none".  After reset a device with an IDCODE
selects it (opcode 1); every other opcode selects BYPASS, as all ones does.
Capture-IR loads ...01.  Prints "listening on HOST:PORT" (or PATH), then
serves clients one after another until killed.

Only the original protocol letters are accepted ('0'..'7', 'R', 'Q',
'r'..'u', 'B', 'b'); anything else is reported on stderr and ends the
connection, so a client that sends more is caught by its tests.

Faults, counted per connection after N 'R' requests have been answered:
  die      the process exits at once (the server killed mid-scan)
  mute     reads on but never answers again (a server that stops answering)
  garbage  answers 'x' instead of '0'/'1'
"""

import argparse
import os
import socket
import sys

TLR, IDLE, SEL_DR, CAP_DR, SHIFT_DR, EXIT1_DR, PAUSE_DR, EXIT2_DR, UPD_DR, \
    SEL_IR, CAP_IR, SHIFT_IR, EXIT1_IR, PAUSE_IR, EXIT2_IR, UPD_IR = range(16)

# next state for TMS = 0 and TMS = 1
NEXT = {
    TLR: (IDLE, TLR), IDLE: (IDLE, SEL_DR), SEL_DR: (CAP_DR, SEL_IR),
    CAP_DR: (SHIFT_DR, EXIT1_DR), SHIFT_DR: (SHIFT_DR, EXIT1_DR),
    EXIT1_DR: (PAUSE_DR, UPD_DR), PAUSE_DR: (PAUSE_DR, EXIT2_DR),
    EXIT2_DR: (SHIFT_DR, UPD_DR), UPD_DR: (IDLE, SEL_DR),
    SEL_IR: (CAP_IR, TLR), CAP_IR: (SHIFT_IR, EXIT1_IR),
    SHIFT_IR: (SHIFT_IR, EXIT1_IR), EXIT1_IR: (PAUSE_IR, UPD_IR),
    PAUSE_IR: (PAUSE_IR, EXIT2_IR), EXIT2_IR: (SHIFT_IR, UPD_IR),
    UPD_IR: (IDLE, SEL_DR),
}

ALLOWED = set(b"01234567RQrstuBb")


class Device:
    def __init__(self, idcode, irlen):
        self.idcode = idcode
        self.irlen = irlen
        self.reset()

    def reset(self):
        self.ir = 1 if self.idcode is not None else (1 << self.irlen) - 1
        self.shift_reg = 0
        self.shift_len = 1

    def uses_idcode(self):
        return self.idcode is not None and self.ir == 1

    def capture(self, reg_ir):
        if reg_ir:
            self.shift_reg, self.shift_len = 0b01, self.irlen
        elif self.uses_idcode():
            self.shift_reg, self.shift_len = self.idcode, 32
        else:
            self.shift_reg, self.shift_len = 0, 1

    def shift(self, tdi):
        out = self.shift_reg & 1
        self.shift_reg = (self.shift_reg >> 1) | (tdi << (self.shift_len - 1))
        return out

    def update(self, reg_ir):
        if reg_ir:
            self.ir = self.shift_reg


class Chain:
    def __init__(self, devices):
        self.devices = devices
        self.reset()

    def reset(self):
        self.state = TLR
        self.tck = 0
        self.tdo = 1
        for d in self.devices:
            d.reset()

    def write(self, tck, tms, tdi):
        if tck and not self.tck:
            self.rising(tms, tdi)
        elif self.tck and not tck:
            # TDO follows the register on the falling edge; high (pulled up)
            # outside the Shift states
            if self.state in (SHIFT_DR, SHIFT_IR) and self.devices:
                self.tdo = self.devices[0].shift_reg & 1
            elif self.state in (SHIFT_DR, SHIFT_IR):
                self.tdo = tdi
            else:
                self.tdo = 1
        self.tck = tck

    def rising(self, tms, tdi):
        s = self.state
        if s in (SHIFT_DR, SHIFT_IR):
            bit = tdi
            for d in reversed(self.devices):
                bit = d.shift(bit)
        if s == TLR:
            for d in self.devices:
                d.reset()
        nxt = NEXT[s][tms]
        if nxt == CAP_DR or nxt == CAP_IR:
            for d in self.devices:
                d.capture(nxt == CAP_IR)
        if nxt == UPD_IR:
            for d in self.devices:
                d.update(True)
        if nxt == TLR:
            for d in self.devices:
                d.reset()
        self.state = nxt


def parse_chain(text):
    devices = []
    for item in text.split(","):
        ident, irlen = item.split(":")
        idcode = None if ident.lower() == "none" else int(ident, 16)
        devices.append(Device(idcode, int(irlen)))
    return devices


def serve_client(conn, srv, chain, fault, after):
    answered = 0
    muted = False
    while True:
        data = conn.recv(65536)
        if not data:
            return
        replies = bytearray()
        for c in data:
            if c not in ALLOWED:
                sys.stderr.write("rbb_server: unexpected request %r\n" % chr(c))
                sys.stderr.flush()
                return
            if c == ord("R"):
                if fault and answered >= after:
                    if fault == "die":
                        srv.close()  # refuse new clients before this one sees the end
                        if replies:
                            conn.sendall(bytes(replies))
                        os._exit(3)
                    if fault == "mute":
                        muted = True
                    if fault == "garbage":
                        replies += b"x"
                        continue
                if not muted:
                    replies += b"1" if chain.tdo else b"0"
                    answered += 1
            elif c == ord("Q"):
                if replies:
                    conn.sendall(bytes(replies))
                return
            elif ord("0") <= c <= ord("7"):
                v = c - ord("0")
                chain.write((v >> 2) & 1, (v >> 1) & 1, v & 1)
            elif ord("r") <= c <= ord("u"):
                if (c - ord("r")) & 2:  # TRST asserted
                    chain.state = TLR
                    for d in chain.devices:
                        d.reset()
        if replies:
            conn.sendall(bytes(replies))


def main():
    p = argparse.ArgumentParser()
    p.add_argument("--chain", default="0x4BA00477:4,0x0362D093:6")
    p.add_argument("--socket")
    p.add_argument("--fault", choices=["die", "mute", "garbage"])
    p.add_argument("--after", type=int, default=0)
    args = p.parse_args()

    chain = Chain(parse_chain(args.chain))
    if args.socket:
        srv = socket.socket(socket.AF_UNIX, socket.SOCK_STREAM)
        srv.bind(args.socket)
        where = args.socket
    else:
        srv = socket.socket(socket.AF_INET, socket.SOCK_STREAM)
        srv.setsockopt(socket.SOL_SOCKET, socket.SO_REUSEADDR, 1)
        srv.bind(("127.0.0.1", 0))
        where = "127.0.0.1:%d" % srv.getsockname()[1]
    srv.listen(4)
    print("listening on " + where, flush=True)
    while True:
        conn, _ = srv.accept()
        if not args.socket:
            conn.setsockopt(socket.IPPROTO_TCP, socket.TCP_NODELAY, 1)
        try:
            serve_client(conn, srv, chain, args.fault, args.after)
        except OSError:
            pass
        conn.close()
        chain.tck = 0


if __name__ == "__main__":
    main()
