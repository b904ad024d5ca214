# SPDX-License-Identifier: MIT
"""Target: an open cable and its chain (``JexJtag_target_*``, ``JexJtag_tap_*``)."""

from __future__ import annotations

import contextlib
import ctypes
import os
from typing import TYPE_CHECKING, Any, Dict, Iterator, List, Mapping, Optional, Union

from . import _library as lib
from . import boundary, svf
from .errors import JtagError
from .records import Device, Pin
from .tapstate import TapState

if TYPE_CHECKING:
    from .session import Session


class Target:
    """A session's open target; made by :meth:`Session.open`, closed by :meth:`close`.

    A context manager: leaving the ``with`` block releases the cable lock
    this process holds and closes the target.  Register data are Python
    ints: bit 0 is the first bit shifted in (and the first that came out).
    """

    def __init__(self, session: "Session", type: str) -> None:
        self._session: Optional["Session"] = session
        self.type = type

    # ---- life time -------------------------------------------------------------
    def _call(self, function: str, *args: Any) -> None:
        if self._session is None:
            raise JtagError("the target is closed", function=function)
        self._session._call(function, self._session.handle, *args)

    @property
    def session(self) -> "Session":
        if self._session is None:
            raise JtagError("the target is closed")
        return self._session

    @property
    def closed(self) -> bool:
        return self._session is None or self._session.closed

    def close(self) -> None:
        """Releases the lock this process holds, then closes the target; safe to repeat."""
        session, self._session = self._session, None
        if session is None or session.closed:
            return
        session._forget_target(self)
        status = ctypes.c_uint(0)
        if not lib.failed(session._lib.JexJtag_target_getLockStatus(session.handle, ctypes.byref(status))) \
                and status.value == lib.JEXJTAG_LOCKED_ME:
            session._lib.JexJtag_target_unlock(session.handle)
        session._call("JexJtag_target_close", session.handle)

    def __enter__(self) -> "Target":
        return self

    def __exit__(self, *exc: object) -> None:
        self.close()

    def __repr__(self) -> str:
        return f"<jexjtag.Target {self.type!r}{' closed' if self.closed else ''}>"

    # ---- information and options --------------------------------------------------
    @property
    def info(self) -> Dict[str, Union[str, int]]:
        """The target's information record: the eleven texts by field name, and ``target_flags``."""
        record = lib.TargetInfo()
        self._call("JexJtag_target_getInfo", ctypes.byref(record))
        info: Dict[str, Union[str, int]] = {
            name: getattr(record, name).decode("utf-8", "replace") for name in lib.INFO_TEXT_FIELDS}
        info["target_flags"] = record.target_flags
        return info

    def get_option(self, key: str) -> str:
        """The value of a plug-in option (the cable's README lists them)."""
        size = 256
        while True:
            value = ctypes.create_string_buffer(size)
            length = ctypes.c_uint(size)
            self._call("JexJtag_target_getOption", key.encode(), value, ctypes.byref(length))
            if length.value < size:
                return value.value.decode("utf-8", "replace")
            size = length.value + 1

    def set_option(self, key: str, value: Any) -> None:
        """Sets a plug-in option; ``True``/``False`` are sent as "true"/"false"."""
        if isinstance(value, bool):
            value = "true" if value else "false"
        self._call("JexJtag_target_setOption", key.encode(), str(value).encode())

    # ---- the cable lock ------------------------------------------------------------
    def lock(self, timeout_ms: int = 5000) -> None:
        """Takes the cross-process cable lock, waiting up to ``timeout_ms`` milliseconds.

        Raises JtagError when another process holds it after that time, or
        when this process already holds it.
        """
        status = ctypes.c_uint(0)
        try:
            self._call("JexJtag_target_lock", int(timeout_ms), ctypes.byref(status))
        except JtagError as error:
            if status.value == lib.JEXJTAG_LOCKED_OTHER:
                error.args = (f"{error.args[0]} (the cable is locked by another process)",)
            raise
        if status.value != lib.JEXJTAG_LOCKED_ME:
            raise JtagError(f"JexJtag_target_lock did not lock the cable (status {status.value})",
                            function="JexJtag_target_lock")

    def unlock(self) -> None:
        """Releases the lock this process holds; JtagError when it holds none."""
        self._call("JexJtag_target_unlock")

    @property
    def is_locked(self) -> bool:
        """True while this process holds the cable lock."""
        status = ctypes.c_uint(0)
        self._call("JexJtag_target_getLockStatus", ctypes.byref(status))
        return status.value == lib.JEXJTAG_LOCKED_ME

    @contextlib.contextmanager
    def locked(self, timeout_ms: int = 5000) -> Iterator["Target"]:
        """``with target.locked(): ...`` holds the cable lock for the block."""
        self.lock(timeout_ms)
        try:
            yield self
        finally:
            if not self.closed:
                self.unlock()

    # ---- the chain ---------------------------------------------------------------------
    def autodetect(self, algorithm: int = 0) -> List[Device]:
        """Scans the chain, takes each device's IR length from the device database; returns :attr:`devices`."""
        self._call("JexJtag_tap_autodetectChain", int(algorithm))
        return self.devices

    @property
    def devices(self) -> List[Device]:
        """The chain as the plug-in describes it; index 0 is the device nearest TDO."""
        count = ctypes.c_uint(0)
        self._call("JexJtag_tap_getDeviceCount", ctypes.byref(count))
        devices = []
        for index in range(count.value):
            bits = ctypes.create_string_buffer(64)
            self._call("JexJtag_tap_getDeviceIdcode", index, bits, len(bits))
            irlen = ctypes.c_uint(0)
            self._call("JexJtag_tap_getIRLength", index, ctypes.byref(irlen))
            idcode = int(bits.value[:32] or b"0", 2)
            record = self.session.lookup(idcode) if idcode else None
            devices.append(Device(index, idcode, irlen.value, record.name if record else None))
        return devices

    def set_ir_length(self, index: int, bits: int) -> None:
        """Corrects a device's IR length in the chain description that device shifts pad with."""
        self._call("JexJtag_tap_setIRLength", int(index), int(bits))

    # ---- TAP ---------------------------------------------------------------------------
    def navigate(self, state: Union[TapState, int], clocks: int = 0) -> None:
        """Moves the TAP to ``state`` by the shortest path, then clocks ``clocks`` times there."""
        self._call("JexJtag_tap_navigate", int(state), int(clocks), 0)

    def shift_ir(self, data: int, bits: int, device: Optional[int] = None,
                 exit_state: Union[TapState, int] = TapState.RUN_TEST_IDLE) -> int:
        """Shifts ``bits`` bits of ``data`` through the instruction register; returns TDO.

        ``device`` None shifts the whole chain; else only that device's IR
        (the plug-in puts the others in BYPASS).  The TAP ends in ``exit_state``.
        """
        return self._shift("IR", data, bits, device, exit_state)

    def shift_dr(self, data: int, bits: int, device: Optional[int] = None,
                 exit_state: Union[TapState, int] = TapState.RUN_TEST_IDLE) -> int:
        """Shifts ``bits`` bits of ``data`` through the data register path; returns TDO.

        ``device`` None shifts the whole chain; else the selected register of
        that device alone.  The TAP ends in ``exit_state``.
        """
        return self._shift("DR", data, bits, device, exit_state)

    def _shift(self, register: str, data: int, bits: int, device: Optional[int],
               exit_state: Union[TapState, int]) -> int:
        if bits < 0 or data < 0 or data >> bits:
            raise ValueError(f"data {data:#x} does not fit {bits} bits")
        size = max(1, (bits + 7) // 8)
        tdi = (ctypes.c_ubyte * size).from_buffer_copy(data.to_bytes(size, "little"))
        tdo = (ctypes.c_ubyte * size)()
        if device is None:
            self._call(f"JexJtag_tap_shiftChain{register}", lib.JEXJTAG_SHIFT_READWRITE, int(exit_state), None,
                       bits, tdi, tdo, None, None)
        else:
            self._call(f"JexJtag_tap_shiftDevice{register}", int(device), lib.JEXJTAG_SHIFT_READWRITE,
                       int(exit_state), None, bits, tdi, tdo, None, None)
        return int.from_bytes(bytes(tdo), "little") & ((1 << bits) - 1)

    # ---- SVF -----------------------------------------------------------------------------
    def play_svf(self, path: Union[str, "os.PathLike[str]"], *, keep_going: bool = False, dry_run: bool = False,
                 max_frequency_hz: float = 0.0, progress: Optional[svf.SvfProgress] = None) -> svf.SvfResult:
        """Plays an SVF file on this target and returns what it did (:class:`SvfResult`).

        Play stops at the first TDO mismatch unless ``keep_going``;
        ``dry_run`` checks the whole file without touching the cable;
        ``max_frequency_hz`` caps TCK (0: the file's FREQUENCY only);
        ``progress(bytes_done, bytes_total, statements_done)`` is called as
        play goes on and cancels it by returning True.  A play that does not
        pass raises :class:`SvfError`, whose ``result`` says how far it came
        and why; an exception raised by ``progress`` cancels the play and is
        raised again.  Take the cable lock first, as for any shift.
        """
        if self._session is None:
            raise JtagError("the target is closed", function="JexJtag_svf_playFile")
        return svf.play(self, path, keep_going, dry_run, max_frequency_hz, progress)

    # ---- boundary scan ---------------------------------------------------------------
    def sample_pins(self, device: int, bsdl: Union[str, "os.PathLike[str]"]) -> List[Pin]:
        """SAMPLE: the pins of chain device ``device`` as its BSDL file ``bsdl`` describes them.

        Every other device is put in BYPASS; the device's IR length is set
        to the file's.  Each :class:`Pin` has the level read (``None`` for a
        pin without a capturing cell), in the order the file declares the
        ports.  Sampling a device that :meth:`drive_pins` or :meth:`highz`
        left in its mode releases it.  Take the cable lock first.
        """
        return boundary.sample(self, device, bsdl)

    def drive_pins(self, device: int, bsdl: Union[str, "os.PathLike[str]"],
                   levels: Mapping[str, Optional[int]]) -> List[Pin]:
        """EXTEST: drives pins of chain device ``device``; returns all its pins as read under EXTEST.

        ``levels`` maps a port element ("IO(0)") or package pin ("9") to 0,
        1 or ``None`` (released, 'z').  Every other cell holds its safe
        value.  A pin without a driving cell, one that cannot be released,
        or one named twice raises JtagError before anything is shifted.
        The device stays in EXTEST (held there while other devices are
        accessed) until :meth:`sample_pins` on it.
        """
        return boundary.extest(self, device, bsdl, levels)

    def highz(self, device: int, bsdl: Union[str, "os.PathLike[str]"]) -> None:
        """HIGHZ: releases every output of chain device ``device`` (held until :meth:`sample_pins` on it)."""
        boundary.highz(self, device, bsdl)
