# SPDX-License-Identifier: MIT
"""Library messages: to the ``logging`` logger "jexjtag", and each session's last error.

One C callback serves every session; the library calls it on the calling
thread, inside the call that raised the message.
"""

from __future__ import annotations

import logging
from typing import Dict, Optional, Tuple

from . import _library as lib

logger = logging.getLogger("jexjtag")
# Silent until the application configures logging (errors also arrive as JtagError).
logger.addHandler(logging.NullHandler())

_LEVELS = {
    lib.JEX_MSG_ERROR: logging.ERROR,
    lib.JEX_MSG_WARNING: logging.WARNING,
    lib.JEX_MSG_STATUS: logging.INFO,
    lib.JEX_MSG_INFO: logging.INFO,
}

SESSION_MASK = 0x00FF0000

# session handle -> (number of error messages, the last one).  Handle 0
# collects what arrives before a session has its handle (during create).
_errors: Dict[int, Tuple[int, Optional[str]]] = {}


def _on_message(handle: int, msg_type: int, text: Optional[bytes]) -> None:
    try:
        message = (text or b"").decode("utf-8", "replace").rstrip("\r\n")
        logger.log(_LEVELS.get(msg_type, logging.DEBUG), "%s", message,
                   extra={"jexjtag_handle": handle, "jexjtag_type": msg_type})
        if msg_type == lib.JEX_MSG_ERROR:
            for key in {handle & SESSION_MASK, 0}:
                count, _ = _errors.get(key, (0, None))
                _errors[key] = (count + 1, message)
    except Exception:  # an exception must never unwind into the library
        pass


callback = lib.MessageCallback(_on_message)


def error_count(handle: int) -> int:
    """How many error messages the session has received so far."""
    return _errors.get(handle & SESSION_MASK, (0, None))[0]


def last_error(handle: int) -> Optional[str]:
    """The last error message the session received, or None."""
    return _errors.get(handle & SESSION_MASK, (0, None))[1]


def forget(handle: int) -> None:
    """Drops a destroyed session's record (its handle may be reused)."""
    _errors.pop(handle & SESSION_MASK, None)
