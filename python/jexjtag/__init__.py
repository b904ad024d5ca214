# SPDX-License-Identifier: MIT
"""jexjtag: JTAG (IEEE 1149.1) boundary-scan chains from Python through libJexJtag.

A thin layer of standard-library ``ctypes`` over the library's C API::

    import jexjtag

    with jexjtag.Session() as session:
        print(session.targets())
        with session.open("jtag_sim") as target, target.locked():
            for device in target.autodetect():
                print(device)
            idcode = target.shift_dr(0, 32, device=1)

Library messages go to the ``logging`` logger "jexjtag"; a failing call
raises :class:`JtagError` with the last error message the session received.
The library file comes from ``$JEXJTAG_LIBRARY``, else from the installation
this package was installed with, else from the system loader
(``libJexJtag.so.1``).
"""

from ._library import api_version
from .errors import JtagError
from .records import BsdlEntity, Device, DeviceRecord, Pin
from .session import Session
from .svf import SvfError, SvfResult
from .tapstate import TapState
from .target import Target

__version__ = "1.0.0"

__all__ = ["Session", "Target", "Device", "DeviceRecord", "BsdlEntity", "Pin", "TapState", "JtagError",
           "SvfResult", "SvfError", "api_version", "__version__"]
