#!/usr/bin/env python3
# SPDX-License-Identifier: MIT
"""Generate data/idcode.lst, the IDCODE list that libJexJtag installs.

The list is compiled from public device data that Debian packages carry:

  openocd         TCL configuration files under /usr/share/openocd/scripts:
                  every `jtag newtap ... -irlen N -expected-id ID` (and
                  `swj_newdap`, the same thing on a JTAG transport) gives an
                  IDCODE with its instruction-register length.  The files
                  are read by a small abstract TCL interpreter (set, if,
                  switch, foreach, proc, source) that follows the JTAG
                  branches, so SWD-only IDs set for other transports are not
                  taken.
  urjtag          the part database under /usr/share/urjtag: MANUFACTURERS
                  (bits 11..1), <maker>/PARTS (bits 27..12),
                  <maker>/<part>/STEPPINGS (bits 31..28) and the part files,
                  whose "instruction length N" line gives the IR length.
  xc3sprog        its built-in device list, written out by `xc3sprog -D`
                  (IDCODE, IR length, name).
  avrdude         /etc/avrdude.conf: 8-bit AVRs with a JTAG interface and
                  their signatures (see read_avrdude); `avarice
                  --known-devices` confirms the part numbers it knows.
  openfpgaloader  `openFPGALoader --list-fpga` (IDCODE, vendor, family,
                  model): names and device categories; it gives no IR
                  length (see ofl_family_claims for the parts only it has).

Run with no arguments after
  apt-get install openocd urjtag xc3sprog avrdude avarice openfpgaloader
to rewrite data/idcode.lst beside this script (set SOURCE_DATE_EPOCH to pin
the date line); see --help for other paths.  `--check FILE` only validates
a list (grammar exactly as the library reads it, sorted, sub type = bits
11..1, at least 600 patterns, known devices); `--self-test` checks the
checker.

How conflicts are resolved (resolve() and pick_irlen()):

* Version bits.  Claims are grouped by IDCODE bits 27..0 (part number and
  manufacturer).  When the sources agree on the IR length for the part and
  no device-naming source (UrJTAG, OpenOCD's ID comments, openFPGALoader,
  the corrections below) gives a different name for a different version,
  the part gets one entry with XXXX in bits 31..28: a new silicon revision
  does not change the instruction register, and an exact version in a
  source is the revision its author had at hand.  When versions differ in
  name (Lattice puts device variants into the version nibble: 0x21111043 is
  LFE5U-12F, 0x41111043 LFE5U-25F) or in IR length, each known version gets
  an exact entry; a claim that covers every revision (OpenOCD
  -ignore-version, xc3sprog, a version-0 openFPGALoader part) then adds an
  XXXX entry as fallback.  An exact entry sorts before the XXXX entry of
  the same part, so a lookup finds it first.

* IR length.  When claims for one pattern differ, a TAP that OpenOCD
  declares -disable (hidden behind a TAP router; several TI files give such
  a DAP the router's IDCODE) yields to a visible declaration of the same
  part.  Then the value with the most independent sources wins (a source
  counts once however many of its files repeat it); on a tie the source
  order OpenOCD, UrJTAG, xc3sprog, avrdude, openFPGALoader decides, then the
  number of files that declare it.  OpenOCD goes first because it checks
  the IR length against the captured IR of every TAP on every scan, so a
  wrong value shows up at once in daily use; UrJTAG's part files come next
  because they are written from the vendors' BSDL files.  Every conflict is
  printed when the script runs (-v prints every decision).

* Names.  Per version, the first source in this order that names the device
  wins: NAME_FIXES below, UrJTAG PARTS, an OpenOCD comment of the form
  "# 0x41111043 - LFE5U_25F", avrdude, xc3sprog, openFPGALoader, then a name
  made from the OpenOCD chip and TAP names (STM32F1X.BS; with the part
  number appended when one TAP declaration accepts several parts).  The
  ARM JTAG-DP (part 0xBA00 of ARM, 0x23B) is shared by hundreds of chips and
  is called ARM_JTAG-DP.  Names are made valid for the list grammar: only
  printable ASCII without '#' (Cyrillic is transliterated), at least 2
  characters.

* UrJTAG directories that serve several JEDEC codes (lattice, analog,
  broadcom, marvell) do not say which code a part carries: a part is kept
  under the code another source knows for the same part or, failing that,
  for a part of the same series (leading letters: BF537 confirms BF533);
  otherwise it is left out.

* Left out: IDCODEs with bit 0 clear (not an IEEE 1149.1 IDCODE), with the
  reserved manufacturer code 0x7F or no manufacturer code at all (0x?0000001
  and the like are what non-compliant chips report), IR lengths outside
  2..64, placeholder entries (xc3sprog's IR length 99 "Unknown" lines), ARM
  SW-DP DPIDR values that OpenOCD passes for SWD-only chips (is_arm_dpidr),
  AVRs where avarice contradicts the signature, and the entries in EXCLUDE.

The output is sorted by pattern text in the byte order the library sorts in
(0 < 1 < X), so regenerating from the same sources gives the same file
except for the date line.
"""

import argparse
import datetime
import os
import re
import shutil
import subprocess
import sys
import tempfile
from collections import defaultdict, namedtuple

# ---------------------------------------------------------------------------
# Constants of the output format

FAMILY_UNKNOWN = 0
FAMILY_FPGA = 1
FAMILY_CPLD = 2
FAMILY_CPU = 3        # microcontroller, processor, SoC
FAMILY_DSP = 4
FAMILY_MEMORY = 5     # memory, configuration PROM
FAMILY_DEBUG = 6      # debug port such as an ARM DAP or a TAP router
FAMILY_OTHER = 7

FAMILY_NAMES = {
    FAMILY_UNKNOWN: "unknown",
    FAMILY_FPGA: "FPGA",
    FAMILY_CPLD: "CPLD",
    FAMILY_CPU: "microcontroller, processor or SoC",
    FAMILY_DSP: "DSP",
    FAMILY_MEMORY: "memory or configuration PROM",
    FAMILY_DEBUG: "debug port (ARM DAP, TAP router)",
    FAMILY_OTHER: "other",
}

MIN_ENTRIES = 600
MFR_XILINX, MFR_ALTERA, MFR_LATTICE, MFR_ATMEL = 0x049, 0x06E, 0x021, 0x01F
IR_MIN, IR_MAX = 2, 64

SOURCE_OPENOCD = "openocd"
SOURCE_URJTAG = "urjtag"
SOURCE_XC3SPROG = "xc3sprog"
SOURCE_OFL = "openfpgaloader"
SOURCE_AVRDUDE = "avrdude"
IR_SOURCE_ORDER = (SOURCE_OPENOCD, SOURCE_URJTAG, SOURCE_XC3SPROG, SOURCE_AVRDUDE, SOURCE_OFL)

# Name sources, best first.
(NAME_FIX, NAME_URJTAG, NAME_OCD_COMMENT, NAME_AVRDUDE, NAME_XC3SPROG, NAME_OFL,
 NAME_OCD_CHIP) = range(7)
DEVICE_NAME_RANKS = (NAME_FIX, NAME_URJTAG, NAME_OCD_COMMENT, NAME_OFL)
NAME_RANK_LABEL = {
    NAME_FIX: "fix", NAME_URJTAG: SOURCE_URJTAG, NAME_OCD_COMMENT: SOURCE_OPENOCD,
    NAME_AVRDUDE: SOURCE_AVRDUDE, NAME_XC3SPROG: SOURCE_XC3SPROG, NAME_OFL: SOURCE_OFL,
    NAME_OCD_CHIP: SOURCE_OPENOCD,
}

# Corrections of names that a source gets wrong, by IDCODE bits 27..0.
NAME_FIXES = {
    # UrJTAG's PARTS line for 0x6E5E says XC2C64-VQ44, but its part
    # directory is xc2c64a-vq44 and OpenOCD and xc3sprog agree: XC2C64A.
    # The XC2C64 (without A) in VQ44 is 0x06C5E093.
    0x06E5E093: "XC2C64A-VQ44",
    # xc3sprog calls the 0x410 device "STM32L1_Med_density"; 0x410 is the
    # STM32F1 medium-density line (ST RM0008; OpenOCD stm32f1x.cfg), the
    # STM32L1 medium-density line is 0x416.
    0x06410041: "STM32F1_Medium_density",
    # xc3sprog names all three XC4VSX parts XC4VSX25; UrJTAG has them apart.
    0x02088093: "XC4VSX35",
    0x020B0093: "XC4VSX55",
    # xc3sprog: "XA7A100T" is the automotive part; the IDCODE is shared by
    # XC7A100T, and the commercial name is the one people look for.
    0x03631093: "XC7A100T",
}

# Entries of a source that are left out, with the reason.
EXCLUDE = {
    (SOURCE_XC3SPROG, 0x0295C095):
        "XC5VLX330 with manufacturer 0x04A; Xilinx is 0x049 (typo in the list)",
}

# Debug ports designed by ARM (JEDEC manufacturer 0x23B) by part number.
ARM_MFR = 0x23B
ARM_PARTS = {
    0xBA00: "ARM_JTAG-DP",
}


def is_arm_dpidr(value):
    """An ARM SW-DP DPIDR rather than a JTAG IDCODE: designer ARM and the DP
    architecture version 1..3 in bits 15..12 (JTAG-DP IDCODEs have part
    numbers like 0xBA00 there).  OpenOCD's swj_newdap passes these for
    SWD-only chips (STM32F0, LPC11xx, nRF51: 0x0BB11477)."""
    return (value >> 1) & 0x7FF == ARM_MFR and (value >> 12) & 0xF in (1, 2, 3)

Claim = namedtuple("Claim", "value all_versions irlen source origin hidden")
Claim.__new__.__defaults__ = (False,)
NameClaim = namedtuple("NameClaim", "value all_versions name rank family origin")


def warn(msg):
    print("generate-idcode-list: " + msg, file=sys.stderr)


# ---------------------------------------------------------------------------
# A small reader for the TCL subset OpenOCD's configuration files use.
#
# It is an abstract interpreter: it follows `set`, `if`, `switch`,
# `foreach`, `source [find ...]` and `proc` calls, knows that the transport
# is JTAG, and where it cannot decide a condition it follows every branch
# and keeps every value a variable may have.  It records each TAP that is
# declared.

UNKNOWN = None


class TclSyntaxError(Exception):
    pass


def tcl_split_commands(text):
    """Split a script into commands, each a list of (kind, text) words.
    kind is 'brace', 'quote', 'bare' or 'expand' ({*} prefix)."""
    cmds = []
    i, n = 0, len(text)
    words = []

    def end_command():
        nonlocal words
        if words:
            cmds.append(words)
        words = []

    while i < n:
        c = text[i]
        if c in " \t\r":
            i += 1
            continue
        if c == "\\" and i + 1 < n and text[i + 1] == "\n":
            i += 2
            continue
        if c in "\n;":
            end_command()
            i += 1
            continue
        if c == "#" and not words:
            while i < n and text[i] != "\n":
                if text[i] == "\\" and i + 1 < n:
                    i += 1
                i += 1
            continue
        kind = None
        if text.startswith("{*}", i) and i + 3 < n and text[i + 3] not in " \t\n;":
            kind = "expand"
            i += 3
            c = text[i]
        if c == "{":
            depth, j = 1, i + 1
            while j < n and depth:
                if text[j] == "\\":
                    j += 2
                    continue
                if text[j] == "{":
                    depth += 1
                elif text[j] == "}":
                    depth -= 1
                j += 1
            if depth:
                raise TclSyntaxError("unbalanced braces")
            words.append((kind or "brace", text[i + 1:j - 1]))
            i = j
        elif c == '"':
            j, depth = i + 1, 0
            while j < n:
                if text[j] == "\\":
                    j += 2
                    continue
                if text[j] == "[":
                    depth += 1
                elif text[j] == "]" and depth:
                    depth -= 1
                elif text[j] == '"' and not depth:
                    break
                j += 1
            words.append((kind or "quote", text[i + 1:j]))
            i = j + 1
        else:
            j, depth = i, 0
            while j < n:
                ch = text[j]
                if ch == "\\":
                    j += 2
                    continue
                if ch == "[":
                    depth += 1
                elif ch == "]" and depth:
                    depth -= 1
                elif ch == "{" and j > i and text[j - 1] == "$":
                    k = text.find("}", j)
                    j = k if k >= 0 else n
                elif not depth and ch in " \t\r\n;":
                    break
                j += 1
            words.append((kind or "bare", text[i:j]))
            i = j
    end_command()
    return cmds


TapDecl = namedtuple("TapDecl", "chips tap irlens ids ignore_version disabled file top")


class TclInterpreter:
    MAX_DEPTH = 12
    MAX_CANDIDATES = 64

    def __init__(self, root):
        self.root = root
        self.taps = []
        self.files_read = set()
        self.comment_names = {}     # IDCODE -> (name, file)
        self._parsed = {}
        self._procs = {}
        self._top = None

    # -- files
    def _commands_of(self, path):
        if path not in self._parsed:
            try:
                with open(path, encoding="utf-8", errors="replace") as f:
                    text = f.read()
            except OSError:
                self._parsed[path] = []
                return []
            self.files_read.add(path)
            self._scan_comment_names(path, text)
            try:
                self._parsed[path] = tcl_split_commands(text)
            except TclSyntaxError as e:
                warn("%s: %s; file skipped" % (path, e))
                self._parsed[path] = []
        return self._parsed[path]

    COMMENT_NAME = re.compile(r"^\s*#\s*(0x[0-9a-fA-F]{8})\s*-\s*(\S+)\s*$")

    def _scan_comment_names(self, path, text):
        for line in text.splitlines():
            m = self.COMMENT_NAME.match(line)
            if m:
                self.comment_names.setdefault(int(m.group(1), 16), (m.group(2), path))

    def run_top(self, path):
        self._top = path
        self._procs = {}
        self._exec_file(path, {}, 0)

    def _exec_file(self, path, env, depth):
        if depth > self.MAX_DEPTH:
            return env
        return self._exec(self._commands_of(path), env, depth, path)

    # -- values
    def _subst(self, word, env, depth):
        """Candidate values of a word (list of strings or UNKNOWN)."""
        kind, text = word
        if kind == "brace":
            return [text]
        results = [""]
        i, n = 0, len(text)
        while i < n:
            c = text[i]
            part = None
            if c == "\\" and i + 1 < n:
                part, i = [text[i + 1]], i + 2
            elif c == "$" and i + 1 < n and (text[i + 1] == "{" or text[i + 1].isalnum()
                                              or text[i + 1] in "_:"):
                if text[i + 1] == "{":
                    k = text.find("}", i)
                    name, i = text[i + 2:k], k + 1
                else:
                    m = re.match(r"[A-Za-z0-9_:]+", text[i + 1:])
                    name, i = m.group(0), i + 1 + m.end()
                name = name.lstrip(":")
                part = env.get(name, [UNKNOWN])
            elif c == "[":
                depth_b, j = 1, i + 1
                while j < n and depth_b:
                    if text[j] == "[":
                        depth_b += 1
                    elif text[j] == "]":
                        depth_b -= 1
                    j += 1
                part = self._command_value(text[i + 1:j - 1], env, depth)
                i = j
            else:
                m = re.match(r"[^\\$\[]+", text[i:])
                if m:
                    part, i = [m.group(0)], i + m.end()
                else:
                    part, i = [c], i + 1
            new = []
            for r in results:
                for p in part:
                    new.append(UNKNOWN if r is UNKNOWN or p is UNKNOWN else r + p)
            results = list(dict.fromkeys(new))[:self.MAX_CANDIDATES]
        return results

    def _command_value(self, script, env, depth):
        """Value of a [command] substitution."""
        cmds = tcl_split_commands(script)
        if len(cmds) != 1:
            return [UNKNOWN]
        words = cmds[0]
        head = words[0][1]
        if head == "find" and len(words) == 2:
            return self._subst(words[1], env, depth)
        if head == "using_jtag":
            return ["1"]
        if head in ("using_swd", "using_hla", "using_dapdirect", "using_swim"):
            return ["0"]
        if head == "string" and len(words) == 4 and words[1][1] in ("compare", "equal"):
            a = self._subst(words[2], env, depth)
            b = self._subst(words[3], env, depth)
            if len(a) == 1 and len(b) == 1 and UNKNOWN not in (a[0], b[0]):
                if words[1][1] == "equal":
                    return ["1" if a[0] == b[0] else "0"]
                return [str((a[0] > b[0]) - (a[0] < b[0]))]
            return [UNKNOWN]
        if head == "info" and len(words) == 3 and words[1][1] == "exists":
            names = self._subst(words[2], env, depth)
            if len(names) == 1 and names[0] is not UNKNOWN:
                return ["1" if names[0].lstrip(":") in env else "0"]
        return [UNKNOWN]

    def _condition(self, word, env, depth):
        """True, False or UNKNOWN."""
        text = word[1].strip()
        neg = False
        while text.startswith("!"):
            neg, text = not neg, text[1:].strip()
        m = re.fullmatch(r"\[([^\[\]]*)\]", text)
        if m:
            vals = self._command_value(m.group(1), env, depth)
            if len(vals) == 1 and vals[0] in ("0", "1"):
                return (vals[0] == "1") != neg
            return UNKNOWN
        m = re.fullmatch(r'(\[[^\[\]]*\]|\S+)\s*(==|!=|eq|ne)\s*(\S+)', text)
        if m and not neg:
            a = self._subst(("quote", m.group(1).strip('"')), env, depth)
            b = self._subst(("quote", m.group(3).strip('"')), env, depth)
            if len(a) == 1 and len(b) == 1 and UNKNOWN not in (a[0], b[0]):
                return (a[0] == b[0]) == (m.group(2) in ("==", "eq"))
        return UNKNOWN

    # -- commands
    def _exec(self, cmds, env, depth, path):
        for words in cmds:
            env = self._exec_one(words, env, depth, path)
        return env

    def _exec_script(self, text, env, depth, path):
        try:
            return self._exec(tcl_split_commands(text), env, depth + 1, path)
        except TclSyntaxError:
            return env

    @staticmethod
    def _merge(envs):
        out = {}
        for e in envs:
            for k, v in e.items():
                out.setdefault(k, [])
                for x in v:
                    if x not in out[k]:
                        out[k].append(x)
        return out

    def _exec_one(self, words, env, depth, path):
        head = words[0][1] if words[0][0] != "expand" else ""
        if head == "set" and len(words) == 3:
            name = self._subst(words[1], env, depth)
            if len(name) == 1 and name[0] is not UNKNOWN:
                env = dict(env)
                env[name[0].lstrip(":")] = self._subst(words[2], env, depth)
            return env
        if head == "unset" and len(words) >= 2:
            env = dict(env)
            for w in words[1:]:
                env.pop(w[1].lstrip(":"), None)
            return env
        if head == "if":
            return self._exec_if(words, env, depth, path)
        if head == "switch":
            return self._exec_switch(words, env, depth, path)
        if head == "foreach" and len(words) == 4:
            var = words[1][1]
            items = self._subst(words[2], env, depth)
            values = []
            for it in items:
                values.extend([UNKNOWN] if it is UNKNOWN else it.split())
            outs = []
            for v in values[:self.MAX_CANDIDATES] or [UNKNOWN]:
                e = dict(env)
                e[var] = [v]
                outs.append(self._exec_script(words[3][1], e, depth, path))
            return self._merge([env] + outs)
        if head == "source" and len(words) >= 2:
            for target in self._subst(words[-1], env, depth):
                if target is UNKNOWN:
                    continue
                p = target if os.path.isabs(target) else os.path.join(self.root, target)
                if os.path.isfile(p):
                    env = self._exec_file(p, env, depth + 1)
            return env
        if head == "proc" and len(words) == 4:
            self._procs[words[1][1]] = (words[2][1].split(), words[3][1])
            return env
        if head == "jtag" and len(words) >= 4 and words[1][1] == "newtap":
            self._newtap(words[2], words[3], words[4:], env, depth, path)
            return env
        if head == "swj_newdap" and len(words) >= 3:
            self._newtap(words[1], words[2], words[3:], env, depth, path)
            return env
        if head == "eval" and len(words) >= 2:
            vals = [self._subst(w, env, depth) for w in words[1:]]
            if all(len(v) == 1 and v[0] is not UNKNOWN for v in vals):
                return self._exec_script(" ".join(v[0] for v in vals), env, depth, path)
            return env
        if head in self._procs and depth < self.MAX_DEPTH:
            params, body = self._procs[head]
            e = dict(env)
            args = words[1:]
            for k, p in enumerate(params):
                p = p.strip("{}")
                if p == "args":
                    vals = [self._subst(w, env, depth) for w in args[k:]]
                    e["args"] = [" ".join(v[0] for v in vals)] if all(
                        len(v) == 1 and v[0] is not UNKNOWN for v in vals) else [UNKNOWN]
                    break
                e[p] = self._subst(args[k], env, depth) if k < len(args) else [UNKNOWN]
            self._exec_script(body, e, depth, path)
            return env
        return env

    def _exec_if(self, words, env, depth, path):
        branches = []   # (condition word or None for else, body)
        i = 1
        while i < len(words):
            cond = words[i]
            i += 1
            if i < len(words) and words[i][1] == "then":
                i += 1
            if i >= len(words):
                break
            branches.append((cond, words[i][1]))
            i += 1
            if i < len(words) and words[i][1] == "elseif":
                i += 1
                continue
            if i < len(words) and words[i][1] == "else":
                i += 1
            if i < len(words):
                branches.append((None, words[i][1]))
            break
        outs = []
        for cond, body in branches:
            verdict = True if cond is None else self._condition(cond, env, depth)
            if verdict is True:
                outs.append(self._exec_script(body, dict(env), depth, path))
                return self._merge(outs) if len(outs) > 1 else outs[0]
            if verdict is UNKNOWN:
                outs.append(self._exec_script(body, dict(env), depth, path))
        outs.append(env)    # no branch taken
        return self._merge(outs)

    def _exec_switch(self, words, env, depth, path):
        i = 1
        while i < len(words) and words[i][1].startswith("-") and words[i][1] != "--":
            i += 1
        if i < len(words) and words[i][1] == "--":
            i += 1
        if i >= len(words):
            return env
        value = self._subst(words[i], env, depth)
        rest = words[i + 1:]
        if len(rest) == 1:
            try:
                inner = tcl_split_commands(rest[0][1])
            except TclSyntaxError:
                return env
            rest = [w for c in inner for w in c]
        pairs = [(rest[k][1], rest[k + 1][1]) for k in range(0, len(rest) - 1, 2)]
        known = len(value) == 1 and value[0] is not UNKNOWN
        outs = []
        fall = False
        for pat, body in pairs:
            hit = fall or not known or pat == "default" or pat == value[0]
            if hit and body == "-":
                fall = True
                continue
            fall = False
            if hit:
                outs.append(self._exec_script(body, dict(env), depth, path))
                if known:
                    return outs[-1]
        outs.append(env)
        return self._merge(outs)

    def _newtap(self, chip_w, tap_w, opts, env, depth, path):
        chips = [c for c in self._subst(chip_w, env, depth) if c is not UNKNOWN]
        taps = [t for t in self._subst(tap_w, env, depth) if t is not UNKNOWN]
        irlens, ids, ignore, disabled = [], [], False, False
        k = 0
        # Options may arrive as one word from `eval ... $args`.
        flat = []
        for w in opts:
            if w[0] == "bare" and " " in w[1]:
                flat.extend(("bare", x) for x in w[1].split())
            else:
                flat.append(w)
        while k < len(flat):
            opt = flat[k][1]
            if opt == "-irlen" and k + 1 < len(flat):
                irlens = self._subst(flat[k + 1], env, depth)
                k += 2
            elif opt == "-expected-id" and k + 1 < len(flat):
                ids.extend(self._subst(flat[k + 1], env, depth))
                k += 2
            elif opt == "-ignore-version":
                ignore = True
                k += 1
            elif opt == "-disable":
                disabled = True
                k += 1
            else:
                k += 1
        self.taps.append(TapDecl(tuple(chips), taps[0] if taps else "", tuple(irlens),
                                 tuple(ids), ignore, disabled, path, self._top))


def parse_int(text):
    if text is UNKNOWN:
        return None
    text = text.strip()
    try:
        return int(text, 0)
    except ValueError:
        return None


def read_openocd(root):
    """OpenOCD: claims, name claims and the files that gave them."""
    interp = TclInterpreter(root)
    tops = []
    for sub in ("target", "cpld", "fpga", "chip", "cpu", "board"):
        d = os.path.join(root, sub)
        for dirpath, dirnames, filenames in os.walk(d):
            dirnames.sort()
            for fn in sorted(filenames):
                if fn.endswith((".cfg", ".tcl")):
                    tops.append(os.path.join(dirpath, fn))
    for top in tops:
        interp.run_top(top)

    claims, names, used = [], [], set()
    for t in interp.taps:
        irs = {parse_int(x) for x in t.irlens}
        irs.discard(None)
        if len(irs) != 1:
            continue
        irlen = irs.pop()
        for raw in t.ids:
            value = parse_int(raw)
            if value is None or value == 0:
                continue
            rel = os.path.relpath(t.file, root)
            claims.append(Claim(value, t.ignore_version, irlen, SOURCE_OPENOCD, rel,
                                t.disabled))
            used.add(t.file)
            family = openocd_family(rel, t.tap, value)
            # A TAP that accepts several part numbers (a family file such
            # as cpld/xilinx-xc7.cfg) names none of them; keep the part
            # number in the name so the entries stay apart.
            parts = {parse_int(x) >> 12 & 0xFFFF for x in t.ids if parse_int(x)}
            suffix = "_%04X" % ((value >> 12) & 0xFFFF) if len(parts) > 1 else ""
            for chip in t.chips:
                names.append(NameClaim(value, t.ignore_version,
                                       openocd_chip_name(chip, t.tap) + suffix,
                                       NAME_OCD_CHIP, family, rel))
    for value, (name, path) in interp.comment_names.items():
        names.append(NameClaim(value, False, lattice_comment_name(name), NAME_OCD_COMMENT,
                               None, os.path.relpath(path, root)))
    return claims, names, sorted(os.path.relpath(p, root) for p in used)


GENERIC_TAP_NAMES = {"cpu", "tap", "arm", "dap", "one", "unknown"}


def openocd_chip_name(chip, tap):
    chip = chip.upper()
    tap = tap.upper()
    if tap.lower() in GENERIC_TAP_NAMES or not tap:
        return chip
    return chip + "." + tap


def lattice_comment_name(text):
    """'LCMXO3L_1300E_XXUWG36/XXMG121' -> 'LCMXO3L-1300E'."""
    parts = [p for p in text.split("/") if not p.upper().startswith("XX")]
    parts = [re.sub(r"_XX[A-Z0-9]+$", "", p) for p in parts]
    return "/".join(p.replace("_", "-") for p in parts)


def openocd_family(rel, tap, value):
    mfr = (value >> 1) & 0x7FF
    part = (value >> 12) & 0xFFFF
    top = rel.split(os.sep)[0]
    name = (rel + " " + tap).lower()
    if mfr == ARM_MFR and (part >> 8) == 0xBA:
        return FAMILY_DEBUG
    if tap.lower() in ("jrc", "icepick", "cltap", "sjc") or "icepick" in name:
        return FAMILY_DEBUG
    if top == "fpga":
        return FAMILY_FPGA
    if top == "cpld":
        if "xcf" in name:
            return FAMILY_MEMORY
        if re.search(r"xc6s|xc7|xcu|ecp|machxo", name):
            return FAMILY_FPGA
        return FAMILY_CPLD
    if mfr in (MFR_XILINX, MFR_ALTERA, MFR_LATTICE) and tap.lower() not in ("ps", "cpu", "arm"):
        return FAMILY_FPGA      # an FPGA's TAP in an SoC or soft-core config
    if tap.lower() == "flash":
        return FAMILY_MEMORY
    if re.search(r"dsp|c6[0-9]|c55|tms320|sharc", name):
        return FAMILY_DSP
    return FAMILY_CPU


# ---------------------------------------------------------------------------
# UrJTAG

def _urjtag_lines(path):
    try:
        with open(path, encoding="latin-1") as f:
            for line in f:
                line = line.split("#", 1)[0].strip()
                if line:
                    yield line.split()
    except OSError:
        return


def _urjtag_irlen(root, path, seen=None):
    seen = seen or set()
    if path in seen:
        return None
    seen.add(path)
    irlen = None
    for fields in _urjtag_lines(path):
        if fields[0] == "instruction" and len(fields) >= 3 and fields[1] == "length":
            irlen = int(fields[2])
        elif fields[0] == "include" and len(fields) >= 2 and irlen is None:
            irlen = _urjtag_irlen(root, os.path.join(root, fields[1]), seen)
    return irlen


def read_urjtag(root):
    mfr_dirs = defaultdict(list)    # directory -> [bits 11..1]
    for fields in _urjtag_lines(os.path.join(root, "MANUFACTURERS")):
        if len(fields) >= 2 and re.fullmatch(r"[01]{11}", fields[0]):
            mfr_dirs[fields[1]].append(int(fields[0], 2))
    claims, names, files = [], [], []
    ambiguous = []
    for mdir in sorted(mfr_dirs):
        codes = mfr_dirs[mdir]
        parts_file = os.path.join(root, mdir, "PARTS")
        for fields in _urjtag_lines(parts_file):
            if len(fields) < 3 or not re.fullmatch(r"[01]{16}", fields[0]):
                continue
            part, pdir, pname = int(fields[0], 2), fields[1], fields[2]
            if pdir == ".":
                continue
            steppings = os.path.join(root, mdir, pdir, "STEPPINGS")
            for sf in _urjtag_lines(steppings):
                if len(sf) < 2 or not re.fullmatch(r"[01]{4}", sf[0]):
                    continue
                version = int(sf[0], 2)
                pfile = os.path.join(root, mdir, pdir, sf[1])
                irlen = _urjtag_irlen(root, pfile)
                if irlen is None:
                    continue
                if len(codes) > 1:
                    # The directory serves several JEDEC codes; which one
                    # the part carries is not in the data.  resolve() keeps
                    # the part only under a code another source confirms.
                    ambiguous.append((mdir, pname, [(version << 28) | (part << 12) | (c << 1) | 1
                                                    for c in codes], irlen,
                                      os.path.relpath(pfile, root)))
                    continue
                value = (version << 28) | (part << 12) | (codes[0] << 1) | 1
                rel = os.path.relpath(pfile, root)
                claims.append(Claim(value, False, irlen, SOURCE_URJTAG, rel))
                names.append(NameClaim(value, False, pname.upper(), NAME_URJTAG,
                                       urjtag_family(mdir, pname), rel))
                files.append(rel)
    return claims, names, sorted(set(files)), ambiguous


def urjtag_family(mdir, pname):
    n = pname.lower()
    if mdir == "xilinx":
        if re.match(r"xc9|xc2c|xcr", n):
            return FAMILY_CPLD
        if re.match(r"xcf|xc18v", n):
            return FAMILY_MEMORY
        if n.startswith("xccace"):
            return FAMILY_OTHER
        return FAMILY_FPGA
    if mdir == "altera":
        if re.match(r"epm|5m", n):
            return FAMILY_CPLD
        if n.startswith("epc"):
            return FAMILY_MEMORY
        return FAMILY_FPGA
    if mdir == "lattice":
        if re.match(r"lc4|m4a|ispmach", n):
            return FAMILY_CPLD
        return FAMILY_FPGA
    if mdir == "philips" and n.startswith("xcr"):
        return FAMILY_CPLD
    if mdir == "atmel" and n.startswith("atf"):
        return FAMILY_CPLD
    if mdir == "analog" or re.match(r"dsp|tms320|sharc", n):
        return FAMILY_DSP
    if re.match(r"bcm5421|88e", n):
        return FAMILY_OTHER     # Ethernet PHYs
    return FAMILY_CPU


# ---------------------------------------------------------------------------
# xc3sprog and openFPGALoader: ask the installed programs for their lists.

def read_xc3sprog(program, listing):
    """Claims from xc3sprog's device list (file, or the program's -D dump)."""
    text = None
    origin = listing
    if listing:
        with open(listing, encoding="latin-1") as f:
            text = f.read()
    elif program and shutil.which(program):
        with tempfile.TemporaryDirectory() as d:
            subprocess.run([program, "-D"], cwd=d, stdout=subprocess.DEVNULL,
                           stderr=subprocess.DEVNULL, check=False)
            p = os.path.join(d, "devlist.txt")
            if os.path.isfile(p):
                with open(p, encoding="latin-1") as f:
                    text = f.read()
        origin = "%s -D" % os.path.basename(program)
    if text is None:
        return [], [], None
    claims, names = [], []
    for line in text.splitlines():
        line = line.split("#", 1)[0].strip()
        m = re.match(r"([0-9A-Fa-f]{8})\s+(\d+)\s+\S+\s+(\S+)", line)
        if not m:
            continue
        value, irlen, name = int(m.group(1), 16), int(m.group(2)), m.group(3)
        if (SOURCE_XC3SPROG, value) in EXCLUDE:
            continue
        # xc3sprog compares IDCODEs without the version nibble (its dump
        # writes them with version 0): every entry covers all revisions.
        claims.append(Claim(value, True, irlen, SOURCE_XC3SPROG, origin))
        names.append(NameClaim(value, True, name, NAME_XC3SPROG, None, origin))
    return claims, names, origin


def read_openfpgaloader(program, listing):
    text, origin = None, listing
    if listing:
        with open(listing, encoding="latin-1") as f:
            text = f.read()
    elif program and shutil.which(program):
        r = subprocess.run([program, "--list-fpga"], stdout=subprocess.PIPE,
                           stderr=subprocess.DEVNULL, check=False)
        text = r.stdout.decode("latin-1")
        origin = "%s --list-fpga" % os.path.basename(program)
    if not text:
        return [], [], None
    lines = text.splitlines()
    header = next((l for l in lines if l.startswith("IDCode")), None)
    if header is None:
        return [], [], None
    cols = [header.index(h) for h in ("manufacturer", "family", "model")]
    names, families = [], []
    listed = [int(l[:10], 16) for l in lines if re.match(r"0x[0-9a-fA-F]{8}\s", l)]
    versions = defaultdict(set)
    for v in listed:
        versions[v & 0x0FFFFFFF].add(v >> 28)
    for line in lines:
        if not re.match(r"0x[0-9a-fA-F]{8}\s", line):
            continue
        value = int(line[:10], 16)
        vendor = line[cols[0]:cols[1]].strip().lower()
        family = line[cols[1]:cols[2]].strip()
        model = line[cols[2]:].strip()
        # The list keeps most parts with version 0 and openFPGALoader
        # compares those without the version nibble: they name the part.
        # Where the list itself has several versions of one part (the ECP5
        # variants) each names its version.
        whole_part = value >> 28 == 0 and versions[value & 0x0FFFFFFF] == {0}
        names.append(NameClaim(value, whole_part, ofl_name(vendor, family, model),
                               NAME_OFL, ofl_family(vendor, family), origin))
        families.append((value, whole_part, vendor, family.lower()))
    return names, families, origin


def ofl_family_claims(families, claims, origin, log):
    """IR lengths for openFPGALoader devices that no IR source knows, from
    the other members of the same openFPGALoader family (vendor and family
    column) when the IR sources know at least one member and all known
    members agree.  Single-die FPGAs of one family share the instruction
    register (Xilinx UG470: 6 bits for all 7-series single-die parts; the
    Cyclone V handbook: 10 bits); multi-die parts differ, so a family with
    no known member, or members that disagree, gets nothing."""
    ir_by_low = defaultdict(set)
    all_versions, exact = set(), set()
    for c in claims:
        if valid_idcode(c.value):
            ir_by_low[c.value & 0x0FFFFFFF].add(c.irlen)
            if c.all_versions:
                all_versions.add(c.value & 0x0FFFFFFF)
            else:
                exact.add(c.value)
    members = defaultdict(list)
    for value, whole_part, vendor, family in families:
        members[(vendor, family)].append((value, whole_part))
    out = []
    for key in sorted(members):
        values = members[key]
        known = set()
        for v, _ in values:
            known |= ir_by_low.get(v & 0x0FFFFFFF, set())
        unknown = [(v, w) for v, w in values
                   if v & 0x0FFFFFFF not in all_versions and v not in exact]
        if not unknown or len(known) != 1:
            continue
        irlen = next(iter(known))
        for v, w in unknown:
            out.append(Claim(v, w, irlen, SOURCE_OFL, origin + " (IR of its family)"))
        log.append("openfpgaloader %s %s: IR %d from its other members for %s" % (
            key[0], key[1], irlen, " ".join("0x%08X" % v for v, _ in unknown)))
    return out


def ofl_name(vendor, family, model):
    name = model
    if vendor == "lattice":
        name = name.replace("LCMX03", "LCMXO3")   # digit 0 for letter O in the list
    if vendor == "xilinx":
        name = model.upper()
        # "artix a7 35t" / "xc7a35": the family column has the T suffix.
        m = re.fullmatch(r"(XC7[AKV])(\d+)", name)
        if m and family.lower().endswith(m.group(2) + "t"):
            name += "T"
    return name


def ofl_family(vendor, family):
    f = family.lower()
    if f in ("xcf",):
        return FAMILY_MEMORY
    if f in ("xc2c", "xc9500xl") or f.startswith("max ii") or f == "max v":
        return FAMILY_CPLD
    return FAMILY_FPGA


# ---------------------------------------------------------------------------
# AVR: avrdude's part list says which AVRs have a JTAG interface and gives
# their signature.  Atmel derives the JTAG part number of an 8-bit AVR from
# signature bytes 1 and 2 (ATmega128: signature 1E 97 02, JTAG ID
# 0x?970203F; megaAVR datasheets, "JTAG Part Number"), with the Atmel
# manufacturer code 0x01F.  avarice, a JTAG debugger for these parts, lists
# the same part numbers (--known-devices) and confirms each where it knows
# the part.  The IR length is not in avrdude.conf: it is taken from the
# 8-bit AVR entries the other sources give, which must all agree.

AVR_JTAG_MODES = ("PM_JTAG", "PM_JTAGmkI", "PM_XMEGAJTAG")


def read_avrdude(conf):
    try:
        with open(conf, encoding="latin-1") as f:
            text = f.read()
    except OSError:
        return []
    parts, by_id = [], {}
    cur = None
    for line in text.splitlines():
        m = re.match(r'^(part|programmer)\b(?:\s+parent\s+"([^"]+)")?', line)
        if m:
            cur = None
            if m.group(1) == "part":
                cur = dict(by_id.get(m.group(2), {})) if m.group(2) else {}
                cur.pop("id", None)
                parts.append(cur)
            continue
        if cur is None:
            continue
        m = re.match(r'^\s+(desc|id|prog_modes|signature)\s*=\s*(.*?)\s*;', line)
        if m:
            cur[m.group(1)] = m.group(2).strip('"')
            if m.group(1) == "id":
                by_id[cur["id"]] = cur
    out = []
    for p in parts:
        modes = re.split(r"[\s|]+", p.get("prog_modes", ""))
        sig = p.get("signature", "").split()
        if not any(mo in modes for mo in AVR_JTAG_MODES) or len(sig) != 3:
            continue
        try:
            b = [int(x, 16) for x in sig]
        except ValueError:
            continue
        if b[0] != 0x1E:
            continue
        out.append((p.get("desc", p.get("id", "")), (b[1] << 8) | b[2]))
    return out


def read_avarice(program):
    if not program or not shutil.which(program):
        return None
    r = subprocess.run([program, "--known-devices"], stdout=subprocess.PIPE,
                       stderr=subprocess.STDOUT, check=False)
    known = {}
    for line in r.stdout.decode("latin-1").splitlines():
        m = re.match(r"\s*(\S+)\s+0x([0-9A-Fa-f]{4})\s", line)
        if m:
            known[m.group(1).lower()] = int(m.group(2), 16)
    return known


def avr_claims(avr_parts, avarice, other_claims, conf, log):
    irs = {c.irlen for c in other_claims
           if (c.value >> 1) & 0x7FF == MFR_ATMEL and 0x90 <= (c.value >> 20) & 0xFF <= 0xAF}
    if len(irs) != 1:
        log.append("avrdude: 8-bit AVR IR lengths in the other sources are %s, not one value;"
                   " AVR list not used" % sorted(irs))
        return [], []
    irlen = irs.pop()
    claims, names = [], []
    for desc, part in avr_parts:
        if avarice is not None and desc.lower() in avarice and avarice[desc.lower()] != part:
            log.append("avrdude %s: signature gives part 0x%04X, avarice 0x%04X; left out"
                       % (desc, part, avarice[desc.lower()]))
            continue
        value = (part << 12) | (MFR_ATMEL << 1) | 1
        claims.append(Claim(value, True, irlen, SOURCE_AVRDUDE, conf))
        names.append(NameClaim(value, True, desc, NAME_AVRDUDE, FAMILY_CPU, conf))
    return claims, names


# ---------------------------------------------------------------------------
# Merging

Entry = namedtuple("Entry", "pattern irlen family subtype name sources")


def valid_idcode(value):
    if not value & 1:
        return False
    if (value >> 1) & 0x7F == 0x7F:
        return False
    if (value >> 1) & 0x7FF == 0:
        return False
    return True


CYRILLIC = dict(zip("АБВГДЕЁЖЗИЙКЛМНОПРСТУФХЦЧШЩЪЫЬЭЮЯ",
                    "A B V G D E E ZH Z I J K L M N O P R S T U F X C CH SH SCH _ Y _ E YU YA".split()))


def clean_name(name, value):
    name = "".join(CYRILLIC.get(ch, ch) for ch in name.upper()) if re.search(
        "[\u0400-\u04ff]", name) else name
    if name.count("(") > name.count(")"):
        name = name[:name.rindex("(")]
    name = re.sub(r"[^\x21-\x7e]+|#+", "_", name.strip()).strip("_")
    if len(name) < 2:
        name = ("MFR%03X_" % ((value >> 1) & 0x7FF)) + name + ("_%04X" % ((value >> 12) & 0xFFFF))
    return name


def pattern_text(value, all_versions):
    bits = format(value, "032b")
    if all_versions:
        bits = "XXXX" + bits[4:]
    return "_".join(bits[i:i + 4] for i in range(0, 32, 4))


def pick_irlen(claims, log, what):
    """IR length with the most independent sources; ties by source order."""
    visible = [c for c in claims if not c.hidden]
    if visible:
        claims = visible
    by_ir = defaultdict(set)
    files = defaultdict(set)
    for c in claims:
        by_ir[c.irlen].add(c.source)
        files[c.irlen].add(c.origin)
    if len(by_ir) == 1:
        return next(iter(by_ir))

    def key(ir):
        srcs = by_ir[ir]
        best = min(IR_SOURCE_ORDER.index(s) for s in srcs)
        return (-len(srcs), best, -len(files[ir]), ir)
    winner = min(by_ir, key=key)
    log.append("IR length conflict for %s: %s -> %d" % (
        what, ", ".join("%d from %s" % (ir, "+".join(sorted(by_ir[ir])))
                        for ir in sorted(by_ir)), winner))
    return winner


def best_name(name_claims, value):
    if value & 0x0FFFFFFF in NAME_FIXES:
        return NAME_FIXES[value & 0x0FFFFFFF], NAME_FIX
    mfr = (value >> 1) & 0x7FF
    part = (value >> 12) & 0xFFFF
    if mfr == ARM_MFR and part in ARM_PARTS:
        return ARM_PARTS[part], NAME_FIX
    if not name_claims:
        return None, None
    rank = min(n.rank for n in name_claims)
    cands = sorted({n.name for n in name_claims if n.rank == rank})
    if rank == NAME_OCD_CHIP and len(cands) > 3:
        # A TAP ID many chips share: name it by the most common chips.
        counts = defaultdict(int)
        for n in name_claims:
            counts[n.name] += 1
        cands = sorted(sorted(cands), key=lambda c: -counts[c])[:3]
        return "/".join(sorted(cands)) + "/...", rank
    return "/".join(cands), rank


def pick_family(name_claims, fallback_rank_name):
    fams = [(n.rank, n.family) for n in name_claims if n.family is not None]
    if not fams:
        return FAMILY_UNKNOWN
    return min(fams)[1]


def resolve(claims, name_claims, ambiguous, log):
    """Turn claims into entries; see the module comment for the rules."""
    # UrJTAG parts of a directory with several manufacturer codes: keep a
    # code only when another source knows the same part under it.
    # Failing that, take the code under which another source knows a part
    # of the same series (same leading letters: BF537 confirms BF533).
    known_parts = {c.value & 0x0FFFFFFF for c in claims}
    series_codes = defaultdict(set)
    for n in name_claims:
        if n.rank != NAME_URJTAG:
            series_codes[name_series(n.name)].add((n.value >> 1) & 0x7FF)
    for mdir, pname, values, irlen, rel in ambiguous:
        hits = [v for v in values if v & 0x0FFFFFFF in known_parts]
        if not hits:
            codes = series_codes.get(name_series(pname), set())
            hits = [v for v in values if (v >> 1) & 0x7FF in codes]
        if len(hits) == 1:
            claims.append(Claim(hits[0], False, irlen, SOURCE_URJTAG, rel))
            name_claims.append(NameClaim(hits[0], False, pname.upper(), NAME_URJTAG,
                                         urjtag_family(mdir, pname), rel))
        else:
            log.append("urjtag %s/%s: manufacturer code not confirmed by another source, left out"
                       % (mdir, pname))

    kept = []
    for c in claims:
        if not valid_idcode(c.value):
            continue
        if not IR_MIN <= c.irlen <= IR_MAX:
            continue
        if is_arm_dpidr(c.value):
            continue
        kept.append(c)

    groups = defaultdict(list)
    for c in kept:
        groups[c.value & 0x0FFFFFFF].append(c)
    names_by_value = defaultdict(list)
    names_by_low = defaultdict(list)
    for n in name_claims:
        names_by_value[n.value].append(n)
        names_by_low[n.value & 0x0FFFFFFF].append(n)

    entries = []
    for low, group in groups.items():
        # A TAP that OpenOCD declares disabled sits behind a TAP router and
        # is not what a chain scan at reset reads; several TI configurations
        # give such a DAP the router's IDCODE.  Where the same part is also
        # declared as a visible TAP, the visible declarations decide.
        visible = [c for c in group if not c.hidden]
        if visible:
            group = visible
        exact = sorted({c.value for c in group if not c.all_versions})
        any_version = [c for c in group if c.all_versions]
        # Names per known version: exact-version name claims, or the
        # all-versions claims of the part.
        low_names = names_by_low[low]
        # Only sources that name devices count as evidence that versions
        # are different devices; OpenOCD's chip names name configuration
        # files, which cover whole families.
        version_names = {}
        for v in exact:
            ncs = [n for n in low_names if n.value == v and not n.all_versions]
            dev = [n for n in ncs if n.rank in DEVICE_NAME_RANKS]
            version_names[v] = best_name(dev, v)[0] if dev else None
        irs = {c.irlen for c in group}
        distinct_names = {normalise(n) for n in version_names.values() if n}
        if len(irs) == 1 and len(distinct_names) <= 1:
            all_names = low_names
            # Prefer names given for the part as a whole, then any version's.
            name, _ = best_name(all_names, group[0].value)
            entries.append(make_entry(low, True, pick_irlen(group, log, hex(low)),
                                      name, all_names, group))
            continue
        for v in exact:
            vclaims = [c for c in group if c.value == v or c.all_versions]
            ncs = [n for n in low_names if n.value == v and not n.all_versions] or low_names
            entries.append(make_entry(v, False, pick_irlen(vclaims, log, "0x%08X" % v),
                                      version_names[v] or best_name(ncs, v)[0], ncs, vclaims))
        if any_version:
            ncs = [n for n in low_names if n.all_versions] or low_names
            name = best_name(ncs, low)[0]
            entries.append(make_entry(low, True, pick_irlen(any_version, log, "X%07X" % low),
                                      name, ncs, any_version))
    return entries


def name_series(name):
    """Leading letters of a device name: 'LC4032V-TQFP48' -> 'LC'."""
    m = re.match(r"(?:ADSP-)?([A-Za-z]+)", name)
    return m.group(1).upper() if m else ""


def normalise(name):
    return re.sub(r"[^A-Z0-9]", "", name.upper())


def make_entry(value, all_versions, irlen, name, name_claims, claims):
    subtype = (value >> 1) & 0x7FF
    if not name:
        name = "MFR%03X_PART%04X" % (subtype, (value >> 12) & 0xFFFF)
    sources = sorted({c.source for c in claims} | {NAME_RANK_LABEL[n.rank] for n in name_claims
                                                   if n.rank == NAME_OFL})
    # Name a chip's own file before the board files that reuse its ID.
    origin = sorted({c.origin for c in claims if c.origin},
                    key=lambda o: (o.startswith("board" + os.sep), o))
    fam = pick_family(name_claims, None)
    if fam == FAMILY_UNKNOWN and any(c.source == SOURCE_XC3SPROG for c in claims):
        fam = xc3sprog_family(name)
    return Entry(pattern_text(value, all_versions), irlen, fam, subtype,
                 clean_name(name, value), (sources, origin))


def xc3sprog_family(name):
    n = name.upper()
    if re.match(r"XCF|XC18V", n):
        return FAMILY_MEMORY
    if re.match(r"XC95|XC2C|XCR", n):
        return FAMILY_CPLD
    if re.match(r"XC|XA", n):
        return FAMILY_FPGA
    if n.startswith("SYSTEMACE"):
        return FAMILY_OTHER
    if n.startswith("ADSP"):
        return FAMILY_DSP
    if n.startswith("ARM_"):
        return FAMILY_DEBUG
    return FAMILY_CPU


# ---------------------------------------------------------------------------
# Output and validation

def pattern_sort_key(pattern):
    return pattern.replace("_", "").encode("ascii")


def format_line(e):
    srcs, origin = e.sources
    note = " ".join(srcs)
    if origin:
        note += ": " + origin[0] + (" (+%d)" % (len(origin) - 1) if len(origin) > 1 else "")
    return "%s %2d %d %4d %s  # %s" % (e.pattern, e.irlen, e.family, e.subtype, e.name, note)


def package_version(pkg):
    try:
        r = subprocess.run(["dpkg-query", "-W", "-f=${Version}", pkg], stdout=subprocess.PIPE,
                           stderr=subprocess.DEVNULL, check=False)
        return r.stdout.decode().strip() or "not installed"
    except OSError:
        return "unknown"


def wrap_list(prefix, items, width=78):
    lines, cur = [], prefix
    for it in items:
        if len(cur) + len(it) + 1 > width and cur.strip("# "):
            lines.append(cur.rstrip())
            cur = "#     "
        cur += it + " "
    lines.append(cur.rstrip())
    return lines


def header(args, counts, files):
    date = datetime.datetime.now(datetime.timezone.utc)
    if os.environ.get("SOURCE_DATE_EPOCH"):
        date = datetime.datetime.fromtimestamp(int(os.environ["SOURCE_DATE_EPOCH"]),
                                               datetime.timezone.utc)
    h = [
        "# IDCODE list of the libJexJtag installation (share/jexjtag/idcode.lst).",
        "#",
        "# Generated by scripts/generate-idcode-list.py on %s; do not edit by hand," % date.strftime("%Y-%m-%d"),
        "# change the script and regenerate.",
        "#",
        "# Line format (fields separated by white space or commas):",
        "#   <pattern> <IR length> <family type> <sub type> <name>",
        "#   pattern      32 characters, bit 31 first: 0, 1, or X for a bit that is",
        "#                not compared; '_' separates groups of 4 and is ignored.",
        "#                Bits 31..28 are the version, 27..12 the part number, 11..1",
        "#                the JEDEC manufacturer code, bit 0 is always 1.  XXXX in",
        "#                the version bits: the entry matches every revision.",
        "#   IR length    instruction register length in bits.",
        "#   family type  device category:",
    ]
    for k in sorted(FAMILY_NAMES):
        h.append("#                  %d %s" % (k, FAMILY_NAMES[k]))
    h += [
        "#   sub type     JEDEC manufacturer code, IDCODE bits 11..1 as a decimal number",
        "#                (73 Xilinx, 110 Altera/Intel FPGA, 33 Lattice, 32 ST, 571 ARM).",
        "#   name         device name, no white space; '#' starts a comment.",
        "# Text after the name says which sources gave the entry.",
        "# Lookups take the first matching line in this order; an exact version",
        "# sorts before the XXXX line of the same part.",
        "#",
        "# Sources (Debian packages):",
        "#   openocd %s: TAP declarations in %s" % (package_version("openocd"), args.openocd),
        "#   urjtag %s: part database in %s" % (package_version("urjtag"), args.urjtag),
        "#   xc3sprog %s: built-in device list (xc3sprog -D)" % package_version("xc3sprog"),
        "#   avrdude %s: 8-bit AVRs with JTAG in %s" % (package_version("avrdude"),
                                                      args.avrdude_conf),
        "#   avarice %s: avarice --known-devices (confirms AVR part numbers)"
        % package_version("avarice"),
        "#   openfpgaloader %s: openFPGALoader --list-fpga (names; IR length of"
        % package_version("openfpgaloader"),
        "#     the family for parts the other sources do not have)",
        "# See scripts/generate-idcode-list.py for how conflicts between sources",
        "# are resolved.  Entries: %d; entries each source contributed to:" % counts["entries"],
        "#   " + ", ".join("%s %d" % (src, counts[src]) for src in IR_SOURCE_ORDER),
        "# Files read that gave entries:",
    ]
    for label, fl in files:
        h += wrap_list("#   %s: " % label, fl)
    h.append("")
    return h


C_SPACE = " \t\n\v\f\r"


def parse_list_line(line):
    """Parse one line exactly as the library's IDCODE list reader does.
    Returns None for a line without data, a tuple (pattern, irlen, family,
    subtype, name) for an entry, or raises ValueError with the reader's
    message."""
    i, n = 0, len(line)
    while i < n and line[i] in C_SPACE:
        i += 1
    pattern, comment = "", False
    while i < n and line[i] not in C_SPACE and line[i] != ",":
        ch = line[i]
        if ch in "01Xx":
            pattern += ch
        elif ch == "#":
            comment = True
            break
        elif ch != "_":
            raise ValueError("invalid character in idcode.")
        i += 1
    fields = []
    for what in ("register length", "family type", "sub type"):
        if comment:
            fields.append("")
            continue
        while i < n and (line[i] in C_SPACE or line[i] == ","):
            i += 1
        start = i
        while i < n and line[i] not in C_SPACE and line[i] != ",":
            if not line[i].isdigit() or not line[i].isascii():
                raise ValueError("non-digit character in %s." % what)
            i += 1
        fields.append(line[start:i])
    name = ""
    if not comment:
        while i < n and (line[i] in C_SPACE or line[i] == ","):
            i += 1
        start = i
        while i < n and line[i] not in C_SPACE and line[i] != "#":
            i += 1
        name = line[start:i]
    if not pattern and not fields[0] and not fields[1] and not name:
        return None
    if len(pattern) != 32 or not all(fields) or len(name) < 2:
        raise ValueError("bad data.")
    return pattern, int(fields[0]), int(fields[1]), int(fields[2]), name


def check_file(path, min_entries=MIN_ENTRIES, spot_checks=True):
    """Validate an IDCODE list; returns a list of problems."""
    problems = []
    patterns = {}
    with open(path, "rb") as f:
        data = f.read()
    try:
        text = data.decode("ascii")
    except UnicodeDecodeError as e:
        problems.append("byte %d: not ASCII" % e.start)
        text = data.decode("latin-1")
    lines = text.split("\n")
    if lines and lines[-1] == "":
        lines.pop()
    for no, line in enumerate(lines):   # numbered from 0, as the reader does
        try:
            entry = parse_list_line(line)
        except ValueError as e:
            problems.append("line:%d - %s" % (no, e))
            continue
        if entry is None:
            continue
        pat, irlen, family, subtype, name = entry
        if pat[31] != "1":
            problems.append("line:%d - bit 0 is not 1" % no)
        if not IR_MIN <= irlen <= IR_MAX:
            problems.append("line:%d - IR length %d out of range" % (no, irlen))
        if family not in FAMILY_NAMES:
            problems.append("line:%d - family type %d undefined" % (no, family))
        if pat[20:31].count("X") == 0 and subtype != int(pat[20:31], 2):
            problems.append("line:%d - sub type %d is not bits 11..1 (%d)"
                            % (no, subtype, int(pat[20:31], 2)))
        if "x" in pat:
            problems.append("line:%d - lower-case x (sorts after X)" % no)
        if pat in patterns:
            problems.append("line:%d - pattern repeated from line:%d" % (no, patterns[pat][0]))
        patterns[pat] = (no, irlen, name)
    keys = [pattern_sort_key(p) for p in patterns]
    if keys != sorted(keys):
        problems.append("entries are not sorted")
    if len(patterns) < min_entries:
        problems.append("only %d distinct patterns, expected at least %d" % (len(patterns), min_entries))
    if spot_checks:
        for code, irlen, name_re in SPOT_CHECKS:
            hit = lookup(patterns, code)
            if hit is None:
                problems.append("0x%08X: no entry" % code)
            elif hit[1] != irlen or not re.search(name_re, hit[2], re.I):
                problems.append("0x%08X: found IR %d %s, expected IR %d /%s/" % (
                    code, hit[1], hit[2], irlen, name_re))
    return problems


def lookup(patterns, code):
    """First match in file order, as the library searches."""
    for pat in sorted(patterns, key=pattern_sort_key):
        if all(p in "Xx" or int(p) == (code >> (31 - i)) & 1 for i, p in enumerate(pat)):
            return patterns[pat]
    return None


# Well-known devices, checked against the vendors' documents:
# (IDCODE, IR length, name pattern).
SPOT_CHECKS = [
    (0x0362D093, 6, r"XC7A35T"),           # Xilinx UG470: XC7A35T
    (0x1362D093, 6, r"XC7A35T"),           # any revision of it
    (0x3BA00477, 4, r"ARM_JTAG-DP"),       # Cortex-M3 r1p1 JTAG-DP (ST RM0008)
    (0x4BA00477, 4, r"ARM_JTAG-DP"),       # Cortex-M4 JTAG-DP
    (0x06410041, 5, r"STM32F1"),           # STM32F1 medium density BS TAP
    (0x16410041, 5, r"STM32F1"),           # its revision Y/1
    (0x41111043, 8, r"LFE5U-25"),          # Lattice ECP5 LFE5U-25F
    (0x21111043, 8, r"LFE5U-12"),          # Lattice ECP5 LFE5U-12F (same part bits)
    (0x020F10DD, 10, r"EP3C10"),           # Altera Cyclone III EP3C10
    (0x0A001093, 8, r"ACE"),               # Xilinx System ACE
    (0x06E5E093, 8, r"XC2C64A"),           # CoolRunner-II XC2C64A VQ44
    (0x05046093, 8, r"XCF04S"),            # Platform Flash XCF04S
]


def self_test():
    """Check the checker: the line grammar on the reader's edge cases, and
    check_file() on small lists.  Returns a list of failures."""
    P = "0000_1010_0000_0000_0001_0000_1001_0011"
    B = P.replace("_", "")
    cases = [
        (P + " 6 1 2 DEVA", (B, 6, 1, 2, "DEVA")),
        ("XXXX" + P[4:].replace(" ", ",") + ",6,1,2,DEVA", ("XXXX" + B[4:], 6, 1, 2, "DEVA")),
        (B[:31] + " 6 1 2 DEVA", "bad data."),
        (B + "1 6 1 2 DEVA", "bad data."),
        (B + " 6 1 2 D", "bad data."),
        (B + " 6 1", "bad data."),
        (B + " 6 1 DEVA", "non-digit character in sub type."),
        (B + " 6 1 2 #note", "bad data."),
        (B + " 6 1 2 DEVA#note", (B, 6, 1, 2, "DEVA")),
        ("0001#", "bad data."),
        ("# comment", None), ("", None), ("    ", None), ("____", None), (",,,", None),
        (B[:-1] + "Z 6 1 2 DEVA", "invalid character in idcode."),
        (B + " 6a 1 2 DEVA", "non-digit character in register length."),
        (B + " 6 1 2 DEV,REV2 more words", (B, 6, 1, 2, "DEV,REV2")),
        (B + " 6 1 2 DEVA\r", (B, 6, 1, 2, "DEVA")),
        (B.replace("1", "x", 1) + " 6 1 2 DEVA", (B.replace("1", "x", 1), 6, 1, 2, "DEVA")),
    ]
    failures = []
    for line, want in cases:
        try:
            got = parse_list_line(line)
        except ValueError as e:
            got = str(e)
        if got != want:
            failures.append("parse %r: got %r, expected %r" % (line, got, want))

    def check_text(text):
        with tempfile.NamedTemporaryFile("w", suffix=".lst", delete=False) as f:
            f.write(text)
        try:
            return check_file(f.name, min_entries=2, spot_checks=False)
        finally:
            os.unlink(f.name)
    a = "0000_0000_0000_0000_0000_0000_0000_0011 4 3 1 AA\n"
    b = "XXXX_0000_0000_0000_0000_0000_0000_0011 4 3 1 BB\n"
    for text, expect in [
            (a + b, None),
            (b + a, "not sorted"),
            (a + a, "repeated"),
            (a, "only 1 distinct"),
            (a + "# x\n" + b.replace(" BB", " B"), "line:2 - bad data."),
            (a + b.replace(" 3 1 ", " 3 2 "), "sub type 2"),
            (a + b.replace("0011 4", "0010 4"), "bit 0"),
            (a + b.replace(" 4 3", " 99 3"), "IR length 99"),
            (a + b.replace(" 4 3", " 4 9"), "family type 9")]:
        problems = check_text(text)
        if expect is None and problems:
            failures.append("check %r: unexpected %s" % (text, problems))
        elif expect is not None and not any(expect in p for p in problems):
            failures.append("check %r: expected a problem with %r, got %s"
                            % (text, expect, problems))
    return failures


# ---------------------------------------------------------------------------

def main(argv):
    here = os.path.dirname(os.path.abspath(__file__))
    ap = argparse.ArgumentParser(description=__doc__.split("\n\n")[0])
    ap.add_argument("--openocd", default="/usr/share/openocd/scripts",
                    help="OpenOCD scripts directory")
    ap.add_argument("--urjtag", default="/usr/share/urjtag", help="UrJTAG data directory")
    ap.add_argument("--xc3sprog", default="xc3sprog",
                    help="xc3sprog program whose -D dump is read")
    ap.add_argument("--xc3sprog-list", help="a saved xc3sprog devlist.txt instead")
    ap.add_argument("--openfpgaloader", default="openFPGALoader",
                    help="openFPGALoader program whose --list-fpga output is read")
    ap.add_argument("--openfpgaloader-list", help="saved --list-fpga output instead")
    ap.add_argument("--avrdude-conf", default="/etc/avrdude.conf",
                    help="avrdude part list (8-bit AVRs with JTAG)")
    ap.add_argument("--avarice", default="avarice",
                    help="avarice program whose --known-devices list confirms AVR part numbers")
    ap.add_argument("-o", "--output", default=os.path.join(here, "..", "data", "idcode.lst"))
    ap.add_argument("--check", metavar="FILE", help="only validate FILE and exit")
    ap.add_argument("--self-test", action="store_true", help="test the validation and exit")
    ap.add_argument("-v", "--verbose", action="store_true", help="print every conflict")
    args = ap.parse_args(argv)

    if args.self_test:
        failures = self_test()
        for f in failures:
            print("self-test: " + f)
        print("self-test: %s" % ("FAILED" if failures else "OK"))
        return 1 if failures else 0

    if args.check:
        problems = check_file(args.check)
        for p in problems:
            print(args.check + ": " + p)
        if not problems:
            print("%s: OK" % args.check)
        return 1 if problems else 0

    for d in (args.openocd, args.urjtag):
        if not os.path.isdir(d):
            warn("%s not found; install the Debian packages openocd and urjtag" % d)
            return 2

    log = []
    ocd_claims, ocd_names, ocd_files = read_openocd(args.openocd)
    urj_claims, urj_names, urj_files, urj_ambiguous = read_urjtag(args.urjtag)
    x3_claims, x3_names, x3_origin = read_xc3sprog(args.xc3sprog, args.xc3sprog_list)
    ofl_names, ofl_families, ofl_origin = read_openfpgaloader(args.openfpgaloader,
                                                              args.openfpgaloader_list)
    if x3_origin is None:
        warn("xc3sprog device list not available (apt-get install xc3sprog)")
    if ofl_origin is None:
        warn("openFPGALoader list not available (apt-get install openfpgaloader)")

    claims = ocd_claims + urj_claims + x3_claims
    avr_parts = read_avrdude(args.avrdude_conf)
    avarice = read_avarice(args.avarice)
    if not avr_parts:
        warn("%s not available (apt-get install avrdude)" % args.avrdude_conf)
    if avarice is None:
        warn("avarice not available (apt-get install avarice); AVR part numbers unconfirmed")
    avr_c, avr_n = avr_claims(avr_parts, avarice, claims, args.avrdude_conf, log)
    claims += avr_c
    if ofl_origin:
        claims += ofl_family_claims(ofl_families, claims, ofl_origin, log)
    names = ocd_names + urj_names + x3_names + ofl_names + avr_n
    entries = resolve(claims, names, urj_ambiguous, log)
    entries.sort(key=lambda e: pattern_sort_key(e.pattern))

    counts = defaultdict(int)
    counts["entries"] = len(entries)
    for e in entries:
        for s in e.sources[0]:
            counts[s] += 1
    files = [("openocd", ocd_files), ("urjtag", urj_files)]
    if x3_origin:
        files.append(("xc3sprog", [x3_origin]))
    if avr_c:
        files.append(("avrdude", [args.avrdude_conf]))
    if ofl_origin:
        files.append(("openfpgaloader", [ofl_origin]))
    out = header(args, counts, files) + [format_line(e) for e in entries]
    # File names may be non-ASCII (two OpenOCD targets have Cyrillic
    # names); the list itself stays ASCII.
    text = ("\n".join(out) + "\n").encode("ascii", "backslashreplace").decode("ascii")
    with open(args.output, "w", encoding="ascii", newline="\n") as f:
        f.write(text)

    for line in log if args.verbose else [l for l in log if "conflict" in l]:
        print(line)
    print("wrote %d entries to %s" % (len(entries), os.path.normpath(args.output)))
    problems = check_file(args.output)
    for p in problems:
        print("check: " + p)
    return 1 if problems else 0


if __name__ == "__main__":
    sys.exit(main(sys.argv[1:]))
