#!/usr/bin/env python3
# SPDX-License-Identifier: MIT
"""A remote_bitbang server with its own model of jtag_sim's default chain,
written apart from the library, for playing SVF files with a peer.

    bitbang_chain.py [--chain bypass4] [--log FILE]

Listens on 127.0.0.1 (a free port), prints "listening on 127.0.0.1:PORT",
serves one client after another until killed.  When a client leaves, FILE
receives what the devices saw during that connection, one event a line:
"RESET" when Test-Logic-Reset is entered, "IR a b c" at each Update-IR (the
instruction of each device, nearest TDO first, hex), "USER<n> v" at each
Update-DR of device n's user register.

Chain (TDI -> device 2 -> device 1 -> device 0 -> TDO): device 0 IDCODE
4BA00477, IR 4, IDCODE 0xE, user 0xA (35 bits); device 1 0362D093, IR 6,
IDCODE 0x09; device 2 41111043, IR 8, IDCODE 0xE0, user 0x32 (32 bits).
IRs capture ...01, BYPASS captures 0, Test-Logic-Reset selects IDCODE.
"--chain bypass4" is four devices with a 2-bit IR and BYPASS only.
"""
import socket
import sys

# IEEE 1149.1 states and their successors for TMS 0 and 1.
NEXT = {
    "RESET": ("IDLE", "RESET"), "IDLE": ("IDLE", "DRSELECT"),
    "DRSELECT": ("DRCAPTURE", "IRSELECT"), "DRCAPTURE": ("DRSHIFT", "DREXIT1"),
    "DRSHIFT": ("DRSHIFT", "DREXIT1"), "DREXIT1": ("DRPAUSE", "DRUPDATE"),
    "DRPAUSE": ("DRPAUSE", "DREXIT2"), "DREXIT2": ("DRSHIFT", "DRUPDATE"),
    "DRUPDATE": ("IDLE", "DRSELECT"), "IRSELECT": ("IRCAPTURE", "RESET"),
    "IRCAPTURE": ("IRSHIFT", "IREXIT1"), "IRSHIFT": ("IRSHIFT", "IREXIT1"),
    "IREXIT1": ("IRPAUSE", "IRUPDATE"), "IRPAUSE": ("IRPAUSE", "IREXIT2"),
    "IREXIT2": ("IRSHIFT", "IRUPDATE"), "IRUPDATE": ("IDLE", "DRSELECT"),
}


class Device:
    def __init__(self, idcode, irlen, idcode_op, user_op=None, user_bits=0):
        self.idcode, self.irlen, self.idcode_op = idcode, irlen, idcode_op
        self.user_op, self.user_bits, self.user = user_op, user_bits, 0
        self.ir = idcode_op
        self.shift, self.length = 0, 1

    def dr(self):
        """(value, length) of the selected data register."""
        if self.idcode is not None and self.ir == self.idcode_op:
            return self.idcode, 32
        if self.user_op is not None and self.ir == self.user_op:
            return self.user, self.user_bits
        return 0, 1


class Chain:
    def __init__(self, devices):
        self.devices = devices  # device 0 nearest TDO
        self.state = "RESET"
        self.events = ["RESET"]
        self.tck = self.tms = self.tdi = 0

    def tdo(self):
        if self.state in ("DRSHIFT", "IRSHIFT"):
            return self.devices[0].shift & 1 if self.devices else self.tdi
        return 1

    def rising_edge(self):
        s = self.state
        if s == "DRCAPTURE":
            for d in self.devices:
                d.shift, d.length = d.dr()
        elif s == "IRCAPTURE":
            for d in self.devices:
                d.shift, d.length = 1, d.irlen
        elif s in ("DRSHIFT", "IRSHIFT"):
            carry = self.tdi
            for d in reversed(self.devices):  # from TDI towards TDO
                out = d.shift & 1
                d.shift = (d.shift >> 1) | (carry << (d.length - 1))
                carry = out
        nxt = NEXT[s][self.tms]
        if s == "IRUPDATE":
            for d in self.devices:
                d.ir = d.shift
            self.events.append("IR " + " ".join("%X" % d.ir for d in self.devices))
        elif s == "DRUPDATE":
            for n, d in enumerate(self.devices):
                if d.user_op is not None and d.ir == d.user_op:
                    d.user = d.shift
                    self.events.append("USER%d %X" % (n, d.user))
        if nxt == "RESET" and s != "RESET":
            for d in self.devices:
                d.ir = d.idcode_op
            self.events.append("RESET")
        self.state = nxt


def make_chain(kind):
    if kind == "bypass4":
        return Chain([Device(None, 2, 3) for _ in range(4)])
    return Chain([Device(0x4BA00477, 4, 0xE, 0xA, 35), Device(0x0362D093, 6, 0x09),
                  Device(0x41111043, 8, 0xE0, 0x32, 32)])


def serve_client(conn, chain):
    replies = bytearray()
    while True:
        data = conn.recv(65536)
        if not data:
            return
        for c in data:
            if 48 <= c <= 55:  # '0'..'7': tck tms tdi
                v = c - 48
                tck = v >> 2
                chain.tms, chain.tdi = (v >> 1) & 1, v & 1
                if tck and not chain.tck:
                    chain.rising_edge()
                chain.tck = tck
            elif c == 82:  # 'R'
                replies.append(48 + chain.tdo())
            elif c == 81:  # 'Q'
                conn.sendall(replies)
                return
            elif 114 <= c <= 117:  # 'r'..'u': TRST asserted when bit 1 is set
                if (c - 114) & 2:
                    chain.state = "RESET"
                    for d in chain.devices:
                        d.ir = d.idcode_op
                    chain.events.append("RESET")
        if replies:
            conn.sendall(replies)
            replies.clear()


def main():
    kind, log = "default", None
    args = sys.argv[1:]
    while args:
        if args[0] == "--chain":
            kind = args[1]
        elif args[0] == "--log":
            log = args[1]
        args = args[2:]
    server = socket.socket(socket.AF_INET, socket.SOCK_STREAM)
    server.setsockopt(socket.SOL_SOCKET, socket.SO_REUSEADDR, 1)
    server.bind(("127.0.0.1", 0))
    server.listen(1)
    print("listening on 127.0.0.1:%d" % server.getsockname()[1], flush=True)
    while True:
        conn, _ = server.accept()
        conn.setsockopt(socket.IPPROTO_TCP, socket.TCP_NODELAY, 1)
        chain = make_chain(kind)
        try:
            serve_client(conn, chain)
        except OSError:
            pass
        conn.close()
        if log:
            with open(log, "w") as f:
                f.write("\n".join(chain.events) + "\n")


if __name__ == "__main__":
    main()
