# SPDX-License-Identifier: MIT
"""Boundary-scan pin access through a BSDL file (``JexJtag_bsdl_*``).

Each call reads the BSDL file into the session as a part, works on one
device of the target's chain (every other device in BYPASS) and releases
the part again.
"""

from __future__ import annotations

import ctypes
import os
from typing import TYPE_CHECKING, List, Mapping, Optional, Tuple, Union

from . import _library as lib
from .errors import JtagError
from .records import Pin

if TYPE_CHECKING:
    from .target import Target

PathLike = Union[str, "os.PathLike[str]"]


class _Part:
    """A BSDL file opened into the target's session, with its pins (``with`` closes it)."""

    def __init__(self, target: "Target", path: PathLike, function: str) -> None:
        self.session = target.session
        if not hasattr(self.session._lib, function):
            raise JtagError("this libJexJtag has no boundary-scan pin access", function=function)
        number = ctypes.c_uint(0)
        self.session._call("JexJtag_bsdl_open", self.session.handle, os.fsencode(path), ctypes.byref(number))
        self.number = number.value
        try:
            summary = lib.BsdlSummary()
            self._call("JexJtag_bsdl_getSummary", ctypes.byref(summary))
            self.pins: List[lib.BsdlPin] = []
            for index in range(summary.pinCount):
                pin = lib.BsdlPin()
                self._call("JexJtag_bsdl_getPin", index, ctypes.byref(pin))
                self.pins.append(pin)
        except BaseException:
            self.close()
            raise

    def _call(self, function: str, *args: object) -> None:
        self.session._call(function, self.session.handle, self.number, *args)

    def levels(self) -> "ctypes.Array[ctypes.c_byte]":
        return (ctypes.c_byte * max(1, len(self.pins)))()

    def records(self, levels: "Optional[ctypes.Array[ctypes.c_byte]]") -> List[Pin]:
        name = self.session._lib.JexJtag_bsdl_functionName
        return [Pin(pin.port.decode("utf-8", "replace"), pin.pin.decode("utf-8", "replace"),
                    (name(pin.function) or b"").decode("ascii", "replace"), pin.cell,
                    None if levels is None or levels[i] < 0 else int(levels[i]))
                for i, pin in enumerate(self.pins)]

    def close(self) -> None:
        if not self.session.closed:
            self.session._lib.JexJtag_bsdl_close(self.session.handle, self.number)

    def __enter__(self) -> "_Part":
        return self

    def __exit__(self, *exc: object) -> None:
        self.close()


def sample(target: "Target", device: int, bsdl: PathLike) -> List[Pin]:
    with _Part(target, bsdl, "JexJtag_bsdl_sample") as part:
        levels = part.levels()
        target._call("JexJtag_bsdl_sample", int(device), part.number, levels, len(part.pins), None, 0)
        return part.records(levels)


def _drive_value(port: str, level: Optional[int]) -> bytes:
    if level is None:
        return b"z"
    if level in (0, 1):  # True/False too
        return b"1" if level else b"0"
    raise ValueError(f"pin {port}: level {level!r} is not 0, 1 or None (released)")


def extest(target: "Target", device: int, bsdl: PathLike, levels: Mapping[str, Optional[int]]) -> List[Pin]:
    items: List[Tuple[str, bytes]] = [(str(port), _drive_value(str(port), level)) for port, level in levels.items()]
    with _Part(target, bsdl, "JexJtag_bsdl_extest") as part:
        names = (ctypes.c_char_p * max(1, len(items)))(*(port.encode() for port, _ in items))
        values = b"".join(value for _, value in items)
        read = part.levels()
        target._call("JexJtag_bsdl_extest", int(device), part.number, len(items), names, values, read,
                     len(part.pins))
        return part.records(read)


def highz(target: "Target", device: int, bsdl: PathLike) -> None:
    with _Part(target, bsdl, "JexJtag_bsdl_highz") as part:
        target._call("JexJtag_bsdl_highz", int(device), part.number)
