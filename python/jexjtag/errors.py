# SPDX-License-Identifier: MIT
"""The exception every failing library call raises."""

from __future__ import annotations

from typing import Optional


class JtagError(Exception):
    """A libJexJtag call failed (or the library could not be loaded).

    ``message`` is the last error message the session received (``None``
    when it has received none); ``function`` names the C function that
    failed, when one did.  ``str(error)`` says what failed and, when the
    library reported an error during that call, why.
    """

    def __init__(self, text: str, message: Optional[str] = None, function: Optional[str] = None) -> None:
        super().__init__(text)
        self.message = message
        self.function = function
