# SPDX-License-Identifier: MIT
# The tests drive the simulated cable jtag_sim of the library named by
# $JEXJTAG_LIBRARY (ctest points it at the build tree).  Cable locks and
# temporary BSDL copies go to a private directory of this run.
import os
import sys
import tempfile

_scratch = tempfile.mkdtemp(prefix="jexjtag-pytest-")
os.environ["JEXJTAG_LOCK_DIR"] = os.path.join(_scratch, "locks")
os.environ["HOME"] = _scratch
sys.path.insert(0, os.path.join(os.path.dirname(os.path.abspath(__file__)), ".."))
