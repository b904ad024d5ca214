# SPDX-License-Identifier: MIT
"""SVF playback on a target (``JexJtag_svf_*``)."""

from __future__ import annotations

import ctypes
import os
from typing import TYPE_CHECKING, Callable, List, NamedTuple, Optional, Union

from . import _library as lib
from . import _messages
from .errors import JtagError

if TYPE_CHECKING:
    from .target import Target

#: progress(bytes_done, bytes_total, statements_done); return True to cancel.
SvfProgress = Callable[[int, int, int], Optional[bool]]

KEEP_GOING = 0x1
DRY_RUN = 0x2
OUTCOMES = ("passed", "mismatch", "bad_file", "cable", "cancelled")
_TEXT_SIZE = 1024


class SvfResult(NamedTuple):
    """What a play did.

    ``outcome`` is "passed", "mismatch", "bad_file", "cable" or "cancelled";
    ``expected``/``actual``/``mask`` are the first mismatch's vectors
    (hexadecimal, as SVF writes them); ``message`` is "<file>:<line>: <text>"
    of the error or the first mismatch ("" when the play passed).
    """

    outcome: str
    statements: int
    checks: int
    mismatches: int
    first_mismatch_line: int
    first_mismatch_bit: int
    error_line: int
    expected: str
    actual: str
    mask: str
    message: str


class SvfError(JtagError):
    """A play that did not pass; ``result`` says how far it came and why."""

    def __init__(self, text: str, result: SvfResult, message: Optional[str] = None) -> None:
        super().__init__(text, message=message, function="JexJtag_svf_playFile")
        self.result = result


def play(target: "Target", path: Union[str, "os.PathLike[str]"], keep_going: bool, dry_run: bool,
         max_frequency_hz: float, progress: Optional[SvfProgress]) -> SvfResult:
    session = target.session
    if not hasattr(session._lib, "JexJtag_svf_playFile"):
        raise JtagError("this libJexJtag has no SVF player", function="JexJtag_svf_playFile")
    error: List[BaseException] = []

    def on_progress(_user: Optional[int], done: int, total: int, statements: int) -> int:
        try:
            return 1 if progress is not None and progress(done, total, statements) else 0
        except BaseException as exc:  # cancel, and raise it after the call
            error.append(exc)
            return 1

    callback = lib.SvfProgressCallback(on_progress)
    options = lib.SvfOptions()
    session._lib.JexJtag_svf_initOptions(ctypes.byref(options))
    options.flags = (KEEP_GOING if keep_going else 0) | (DRY_RUN if dry_run else 0)
    options.maxFrequencyHz = float(max_frequency_hz)
    options.progress = callback
    texts = [ctypes.create_string_buffer(_TEXT_SIZE) for _ in range(4)]
    result = lib.SvfResult()
    result.expected, result.actual, result.mask, result.message = [ctypes.addressof(t) for t in texts]
    result.expectedSize = result.actualSize = result.maskSize = result.messageSize = _TEXT_SIZE
    before = _messages.error_count(session.handle)
    status = session._lib.JexJtag_svf_playFile(session.handle, os.fsencode(path), ctypes.byref(options),
                                               ctypes.byref(result))
    if error:
        raise error[0]
    outcome = OUTCOMES[result.outcome] if result.outcome < len(OUTCOMES) else str(result.outcome)
    record = SvfResult(outcome, result.statements, result.checks, result.mismatches, result.firstMismatchLine,
                       result.firstMismatchBit, result.errorLine,
                       *[t.value.decode("utf-8", "replace") for t in texts])
    if lib.failed(status):
        fresh = _messages.error_count(session.handle) > before
        raise SvfError(f"SVF play {outcome}: {record.message or os.fspath(path)}", record,
                       message=_messages.last_error(session.handle) if fresh else record.message)
    return record
