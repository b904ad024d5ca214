# SPDX-License-Identifier: MIT
"""TAP controller states (IEEE 1149.1), numbered as the C API numbers them."""

from __future__ import annotations

import enum


class TapState(enum.IntEnum):
    """The sixteen states of the TAP controller (``JexJtagTapState``)."""

    TEST_LOGIC_RESET = 0
    RUN_TEST_IDLE = 1
    SELECT_DR_SCAN = 2
    CAPTURE_DR = 3
    SHIFT_DR = 4
    EXIT1_DR = 5
    PAUSE_DR = 6
    EXIT2_DR = 7
    UPDATE_DR = 8
    SELECT_IR_SCAN = 9
    CAPTURE_IR = 10
    SHIFT_IR = 11
    EXIT1_IR = 12
    PAUSE_IR = 13
    EXIT2_IR = 14
    UPDATE_IR = 15
