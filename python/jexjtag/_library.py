# SPDX-License-Identifier: MIT
"""Finding and loading libJexJtag.so, and the C prototypes the package calls.

The library is taken from ``$JEXJTAG_LIBRARY`` when it is set, else from the
installation this package was installed with (``_install.py``, written by
``cmake --install``), else through the system loader (``libJexJtag.so.1``).
"""

from __future__ import annotations

import ctypes
import os
import threading
from typing import List, Optional

from .errors import JtagError

SONAME = "libJexJtag.so.1"
LIBRARY_ENV = "JEXJTAG_LIBRARY"

JEX_FAILURE_BIT = 0x80000000
JEX_MSG_ERROR = 0x100
JEX_MSG_WARNING = 0x200
JEX_MSG_STATUS = 0x300
JEX_MSG_INFO = 0x400
JEX_MSG_NOISE = 0x500

JEXJTAG_SHIFT_READWRITE = 3
JEXJTAG_LOCKED_OTHER = 1
JEXJTAG_LOCKED_ME = 2

INFO_TEXT_SIZE = 1024
INFO_TEXT_FIELDS = ("target_name", "plugin_name", "fw_ver", "driver_ver", "plugin_ver", "vendor",
                    "frequency", "port", "full_name", "target_uid", "rawinfo")


class TargetInfo(ctypes.Structure):
    """``JexJtagTargetInfo``: eleven 1024-byte texts and the flags (11,268 bytes)."""

    _fields_ = [(name, ctypes.c_char * INFO_TEXT_SIZE) for name in INFO_TEXT_FIELDS] + [
        ("target_flags", ctypes.c_uint32)]


assert ctypes.sizeof(TargetInfo) == 11268

MessageCallback = ctypes.CFUNCTYPE(None, ctypes.c_uint, ctypes.c_uint, ctypes.c_char_p)

_u = ctypes.c_uint
_pu = ctypes.POINTER(ctypes.c_uint)
_s = ctypes.c_char_p
_buf = ctypes.c_void_p
_shift_device = [_u, _u, _u, _u, ctypes.c_void_p, _u, _buf, _buf, _buf, _buf]
_shift_chain = [_u, _u, _u, ctypes.c_void_p, _u, _buf, _buf, _buf, _buf]

# name -> argument types; every function returns a uint32_t status.
PROTOTYPES = {
    "JexJtag_session_getAPIVersion": [_pu, _s, _u],
    "JexJtag_session_create": [MessageCallback, _u, ctypes.POINTER(_s), _pu],
    "JexJtag_session_destroy": [_u],
    "JexJtag_session_getTargetCount": [_u, _pu],
    "JexJtag_session_getTargetXMLSizeByIndex": [_u, _u, _pu],
    "JexJtag_session_getTargetByIndex": [_u, _u, _s, _u, _s, _u, _s, _u],
    "JexJtag_target_open": [_u, _s, ctypes.c_void_p, _u, ctypes.POINTER(_s), ctypes.POINTER(TargetInfo)],
    "JexJtag_target_close": [_u],
    "JexJtag_target_setOption": [_u, _s, _s],
    "JexJtag_target_getOption": [_u, _s, _s, _pu],
    "JexJtag_target_lock": [_u, _u, _pu],
    "JexJtag_target_unlock": [_u],
    "JexJtag_target_getLockStatus": [_u, _pu],
    "JexJtag_target_flush": [_u],
    "JexJtag_target_getInfo": [_u, ctypes.POINTER(TargetInfo)],
    "JexJtag_tap_autodetectChain": [_u, _u],
    "JexJtag_tap_getDeviceCount": [_u, _pu],
    "JexJtag_tap_getIRLength": [_u, _u, _pu],
    "JexJtag_tap_setIRLength": [_u, _u, _u],
    "JexJtag_tap_getDeviceIdcode": [_u, _u, _s, _u],
    "JexJtag_tap_navigate": [_u, _u, _u, _u],
    "JexJtag_tap_shiftChainIR": _shift_chain,
    "JexJtag_tap_shiftDeviceIR": _shift_device,
    "JexJtag_tap_shiftChainDR": _shift_chain,
    "JexJtag_tap_shiftDeviceDR": _shift_device,
    "JexJtag_db_addDeviceData": [_u, _s, _s, _u],
    "JexJtag_db_lookupDevice": [_u, _s, _s, _u, _pu, _s, _u],
    "JexJtag_db_parseBSDLFile": [_u, _s, _s, _u, _pu, _s, _u, _s, _u],
}

# ---- SVF player ---------------------------------------------------------------------
SvfProgressCallback = ctypes.CFUNCTYPE(ctypes.c_int, ctypes.c_void_p, ctypes.c_uint64, ctypes.c_uint64,
                                       ctypes.c_uint64)


class SvfOptions(ctypes.Structure):
    """``JexJtagSvfOptions`` (32 bytes)."""

    _fields_ = [("flags", ctypes.c_uint32), ("reserved", ctypes.c_uint32), ("maxFrequencyHz", ctypes.c_double),
                ("progress", SvfProgressCallback), ("progressUser", ctypes.c_void_p)]


class SvfResult(ctypes.Structure):
    """``JexJtagSvfResult`` (104 bytes); the caller owns the four text buffers."""

    _fields_ = [("statements", ctypes.c_uint64), ("checks", ctypes.c_uint64), ("mismatches", ctypes.c_uint64),
                ("firstMismatchLine", ctypes.c_uint64), ("firstMismatchBit", ctypes.c_uint64),
                ("errorLine", ctypes.c_uint64), ("outcome", ctypes.c_uint32), ("expectedSize", ctypes.c_uint32),
                ("expected", ctypes.c_void_p), ("actualSize", ctypes.c_uint32), ("maskSize", ctypes.c_uint32),
                ("actual", ctypes.c_void_p), ("mask", ctypes.c_void_p), ("messageSize", ctypes.c_uint32),
                ("reserved", ctypes.c_uint32), ("message", ctypes.c_void_p)]


assert ctypes.sizeof(SvfOptions) == 32 and ctypes.sizeof(SvfResult) == 104

# ---- boundary scan ------------------------------------------------------------------
BSDL_NAME_SIZE = 128
BSDL_SHORT_SIZE = 32


class BsdlSummary(ctypes.Structure):
    """``JexBsdlSummary`` (184 bytes)."""

    _fields_ = [("entity", ctypes.c_char * BSDL_NAME_SIZE), ("idcode", ctypes.c_char * 36),
                ("irLength", ctypes.c_uint32), ("boundaryLength", ctypes.c_uint32),
                ("instructionCount", ctypes.c_uint32), ("pinCount", ctypes.c_uint32),
                ("registerAccessCount", ctypes.c_uint32)]


class BsdlPin(ctypes.Structure):
    """``JexBsdlPin`` (184 bytes)."""

    _fields_ = [("port", ctypes.c_char * BSDL_NAME_SIZE), ("pin", ctypes.c_char * BSDL_SHORT_SIZE),
                ("function", ctypes.c_uint32), ("cell", ctypes.c_int32), ("inputCell", ctypes.c_int32),
                ("outputCell", ctypes.c_int32), ("controlCell", ctypes.c_int32), ("reserved", ctypes.c_uint32)]


assert ctypes.sizeof(BsdlSummary) == 184 and ctypes.sizeof(BsdlPin) == 184

_levels = ctypes.POINTER(ctypes.c_byte)  # signed char levels[]: 0, 1, -1

# Declared when the library has them (a library older than the SVF player or
# boundary scan lacks these).
OPTIONAL_PROTOTYPES = {
    "JexJtag_svf_initOptions": [ctypes.POINTER(SvfOptions)],
    "JexJtag_svf_playFile": [_u, _s, ctypes.POINTER(SvfOptions), ctypes.POINTER(SvfResult)],
    "JexJtag_bsdl_open": [_u, _s, _pu],
    "JexJtag_bsdl_close": [_u, _u],
    "JexJtag_bsdl_getSummary": [_u, _u, ctypes.POINTER(BsdlSummary)],
    "JexJtag_bsdl_getPin": [_u, _u, _u, ctypes.POINTER(BsdlPin)],
    "JexJtag_bsdl_sample": [_u, _u, _u, _levels, _u, ctypes.c_void_p, _u],
    "JexJtag_bsdl_extest": [_u, _u, _u, _u, ctypes.POINTER(_s), _s, _levels, _u],
    "JexJtag_bsdl_highz": [_u, _u, _u],
}

_lock = threading.Lock()
_library: Optional[ctypes.CDLL] = None


def installed_library() -> Optional[str]:
    """Path of the library of the installation this package came with, or None."""
    try:
        from . import _install  # type: ignore[attr-defined]  # written by cmake --install
    except ImportError:
        return None
    path = os.path.join(os.path.dirname(os.path.abspath(__file__)), _install.LIBRARY)
    return os.path.normpath(path)


def candidates() -> List[str]:
    """The library files tried, in order (the first that is set or exists wins)."""
    configured = os.environ.get(LIBRARY_ENV)
    if configured:
        return [configured]
    installed = installed_library()
    if installed and os.path.exists(installed):
        return [installed]
    return [SONAME]


def _declare(lib: ctypes.CDLL) -> None:
    optional = {name: types for name, types in OPTIONAL_PROTOTYPES.items() if hasattr(lib, name)}
    for name, argtypes in {**PROTOTYPES, **optional}.items():
        function = getattr(lib, name)
        function.argtypes = argtypes
        function.restype = ctypes.c_uint32
    if hasattr(lib, "JexJtag_bsdl_functionName"):  # the one that returns a static text
        lib.JexJtag_bsdl_functionName.argtypes = [ctypes.c_uint32]
        lib.JexJtag_bsdl_functionName.restype = ctypes.c_char_p


def library() -> ctypes.CDLL:
    """The loaded library with its prototypes declared; loaded on first use."""
    global _library
    with _lock:
        if _library is None:
            path = candidates()[0]
            try:
                lib = ctypes.CDLL(path)
                _declare(lib)
            except (OSError, AttributeError) as error:
                raise JtagError(f"cannot load libJexJtag from {path}: {error} "
                                f"(set {LIBRARY_ENV} to the library file)") from error
            _library = lib
        return _library


def failed(status: int) -> bool:
    """True for a failure status (bit 31 set)."""
    return (status & JEX_FAILURE_BIT) != 0


def api_version() -> "tuple[int, str]":
    """The library's API version number and its text ("Version ...")."""
    version = ctypes.c_uint(0)
    text = ctypes.create_string_buffer(128)
    if failed(library().JexJtag_session_getAPIVersion(ctypes.byref(version), text, len(text))):
        raise JtagError("JexJtag_session_getAPIVersion failed", function="JexJtag_session_getAPIVersion")
    return version.value, text.value.decode("utf-8", "replace")
