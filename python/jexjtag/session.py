# SPDX-License-Identifier: MIT
"""Session: the host's connection to libJexJtag (``JexJtag_session_*``, ``JexJtag_db_*``)."""

from __future__ import annotations

import ctypes
import os
from typing import Any, List, Optional, Union

from . import _library as lib
from . import _messages
from .errors import JtagError
from .records import BsdlEntity, DeviceRecord
from .target import Target

PathLike = Union[str, "os.PathLike[str]"]


def _text(value: Any) -> str:
    if isinstance(value, bool):
        return "true" if value else "false"
    return os.fspath(value) if isinstance(value, os.PathLike) else str(value)


def _argv(texts: List[str]) -> "ctypes.Array[ctypes.c_char_p]":
    return (ctypes.c_char_p * max(1, len(texts)))(*[t.encode() for t in texts])


def idcode_bits(idcode: int) -> str:
    """The 32 '0'/'1' characters of an IDCODE, most significant bit first."""
    if not 0 <= idcode <= 0xFFFFFFFF:
        raise ValueError(f"IDCODE {idcode:#x} does not fit 32 bits")
    return format(idcode, "032b")


class Session:
    """A library session: target list, device database, BSDL files, one open target.

    ``datadir`` chooses the directory of the device list ``idcode.lst``
    (default: the installation's).  Use it as a context manager, or call
    :meth:`close`; closing also closes the session's target.  Library
    messages go to the ``logging`` logger "jexjtag".  The library takes no
    lock: use a session (and its target) from one thread at a time.

    >>> with jexjtag.Session() as session:
    ...     with session.open("jtag_sim") as target, target.locked():
    ...         print(target.autodetect())
    """

    def __init__(self, datadir: Optional[PathLike] = None, *, unload_targets_on_destroy: bool = True) -> None:
        self._lib = lib.library()
        self._handle = 0
        self._target: Optional[Target] = None
        args = []
        if datadir is not None:
            args.append("datadir=" + os.fspath(datadir))
        if not unload_targets_on_destroy:
            args.append("unloadtargetsondestroy=false")
        handle = ctypes.c_uint(0)
        self._call("JexJtag_session_create", _messages.callback, len(args), _argv(args), ctypes.byref(handle))
        self._handle = handle.value

    # ---- life time ---------------------------------------------------------
    @property
    def handle(self) -> int:
        """The session's C handle (0 once closed)."""
        return self._handle

    @property
    def closed(self) -> bool:
        return self._handle == 0

    def close(self) -> None:
        """Closes the target (releasing its lock) and destroys the session; safe to repeat."""
        if self._handle == 0:
            return
        try:
            if self._target is not None:
                self._target.close()
        finally:
            handle, self._handle = self._handle, 0
            self._lib.JexJtag_session_destroy(handle)
            _messages.forget(handle)

    def __enter__(self) -> "Session":
        return self

    def __exit__(self, *exc: object) -> None:
        self.close()

    def __del__(self) -> None:
        try:
            self.close()
        except Exception:
            pass

    def __repr__(self) -> str:
        return f"<jexjtag.Session handle={self._handle:#x}>"

    # ---- calls -------------------------------------------------------------
    def _call(self, function: str, *args: Any) -> None:
        """Calls a C function; a failure status raises JtagError with the session's last error."""
        if function != "JexJtag_session_create" and self._handle == 0:
            raise JtagError("the session is closed", function=function)
        before = _messages.error_count(self._handle)
        status = getattr(self._lib, function)(*args)
        if lib.failed(status):
            message = _messages.last_error(self._handle)
            fresh = _messages.error_count(self._handle) > before
            raise JtagError(f"{function} failed" + (f": {message}" if fresh and message else ""),
                            message=message, function=function)

    # ---- targets -------------------------------------------------------------
    def targets(self) -> List[str]:
        """Names of the target types the installed plug-ins offer, in discovery order."""
        count = ctypes.c_uint(0)
        self._call("JexJtag_session_getTargetCount", self._handle, ctypes.byref(count))
        names = []
        for index in range(count.value):
            xml = ctypes.create_string_buffer(1)
            name = ctypes.create_string_buffer(1024)
            plugin = ctypes.create_string_buffer(1024)
            self._call("JexJtag_session_getTargetByIndex", self._handle, index, xml, len(xml),
                       name, len(name), plugin, len(plugin))
            names.append(name.value.decode("utf-8", "replace"))
        return names

    def open(self, type: str, **args: Any) -> Target:
        """Opens a target of the given type; each keyword becomes a ``key=value`` open argument.

        ``True``/``False`` are passed as "true"/"false".  A session has one
        target: opening a second one closes the first.  Unknown types and
        refused arguments raise JtagError.
        """
        if self._target is not None:
            self._target.close()
        texts = [f"{key}={_text(value)}" for key, value in args.items()]
        info = lib.TargetInfo()
        self._call("JexJtag_target_open", self._handle, type.encode(), None, len(texts), _argv(texts),
                   ctypes.byref(info))
        self._target = Target(self, type)
        return self._target

    def _forget_target(self, target: Target) -> None:
        if self._target is target:
            self._target = None

    # ---- device database and BSDL ---------------------------------------------
    def lookup(self, idcode: int) -> Optional[DeviceRecord]:
        """The device database's entry for an IDCODE, or None when no entry matches."""
        name = ctypes.create_string_buffer(1024)
        irlen = ctypes.c_uint(0)
        bypass = ctypes.create_string_buffer(1024)
        self._call("JexJtag_db_lookupDevice", self._handle, idcode_bits(idcode).encode(), name, len(name),
                   ctypes.byref(irlen), bypass, len(bypass))
        if not name.value:
            return None
        return DeviceRecord(idcode, name.value.decode("utf-8", "replace"), irlen.value,
                            bypass.value.decode("ascii", "replace"))

    def add_device_data(self, text: str, filename: str = "<python>") -> None:
        """Adds IDCODE list lines (``idcode.lst`` syntax) to this session's database.

        Its entries win over the installation's; ``filename`` labels messages.
        A bad line raises JtagError, the lines before it stay.
        """
        data = text.encode()
        self._call("JexJtag_db_addDeviceData", self._handle, filename.encode(), data, len(data))

    def bsdl(self, path: PathLike) -> BsdlEntity:
        """Reads a BSDL file: entity name, IR length, IDCODE register text, BYPASS opcode."""
        entity = ctypes.create_string_buffer(1024)
        irlen = ctypes.c_uint(0)
        idcode = ctypes.create_string_buffer(64)
        bypass = ctypes.create_string_buffer(1024)
        self._call("JexJtag_db_parseBSDLFile", self._handle, os.fsencode(path), entity, len(entity),
                   ctypes.byref(irlen), idcode, len(idcode), bypass, len(bypass))
        return BsdlEntity(entity.value.decode("utf-8", "replace"), irlen.value,
                          idcode.value.decode("ascii", "replace"), bypass.value.decode("ascii", "replace"))

