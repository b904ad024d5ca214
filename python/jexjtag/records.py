# SPDX-License-Identifier: MIT
"""Plain records the package returns: chain devices, database entries, BSDL entities, pins."""

from __future__ import annotations

from typing import NamedTuple, Optional


class Device(NamedTuple):
    """One device of a detected chain.

    ``index`` 0 is the device nearest TDO; ``idcode`` is 0 for a device
    without an IDCODE register; ``name`` comes from the device database and
    is ``None`` for a device it does not know.
    """

    index: int
    idcode: int
    ir_length: int
    name: Optional[str]

    def __repr__(self) -> str:
        return (f"Device(index={self.index}, idcode={self.idcode:#010x}, ir_length={self.ir_length}, "
                f"name={self.name!r})")


class DeviceRecord(NamedTuple):
    """A device database entry: name, IR length and BYPASS instruction ('1' per IR bit)."""

    idcode: int
    name: str
    ir_length: int
    bypass: str

    def __repr__(self) -> str:
        return (f"DeviceRecord(idcode={self.idcode:#010x}, name={self.name!r}, ir_length={self.ir_length}, "
                f"bypass={self.bypass!r})")


class BsdlEntity(NamedTuple):
    """What a BSDL file says about a device.

    ``idcode`` is the IDCODE register as the file writes it, most significant
    bit first, 'X' for bits that do not matter ("" when the device has none);
    ``bypass`` is the BYPASS instruction's opcode.
    """

    entity: str
    ir_length: int
    idcode: str
    bypass: str


class Pin(NamedTuple):
    """One pin of a BSDL part, as ``jexjtag pins --json`` lists it.

    ``port`` is the port element ("IO(0)", "CLK"); ``pin`` the package pin
    ("9", "A4"; "" when the file maps none); ``function`` the BSDL function
    of the pin ("bidir" for a pin with a driving and a capturing cell);
    ``cell`` the driving cell, else the capturing one; ``level`` the level
    read (0 or 1), ``None`` for a pin without a capturing cell.
    """

    port: str
    pin: str
    function: str
    cell: int
    level: Optional[int]
