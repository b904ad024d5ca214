# SPDX-License-Identifier: MIT
# The package end to end on the simulated cable: chain, shifts, options,
# lock, database, BSDL, pins, failures and messages.
import logging
import os

import pytest

import jexjtag
from jexjtag import JtagError, TapState

CHAIN = [(0x4BA00477, 4), (0x0362D093, 6), (0x41111043, 8)]  # jtag_sim's default chain
TESTS = os.path.join(os.path.dirname(os.path.abspath(__file__)), "..", "..", "tests")
BSDL = os.path.join(TESTS, "bsdl", "data", "st_STM32U535_U545_UFBGA100.bsd")


def test_reads_the_simulated_chain_and_shifts_idcodes():
    port = f"py{os.getpid()}"
    with jexjtag.Session() as session:
        assert "jtag_sim" in session.targets()
        with session.open("jtag_sim", port=port) as target:
            assert target.info["target_name"] == "jtag_sim"
            assert target.info["target_uid"] == f"jtag_sim:{port}"
            with target.locked():
                devices = target.autodetect()
                assert [(d.idcode, d.ir_length) for d in devices] == CHAIN
                assert [d.index for d in devices] == [0, 1, 2]
                assert devices[1].name == session.lookup(0x0362D093).name

                # Device 1's IDCODE instruction (0x09), then its 32-bit IDCODE register.
                assert target.shift_ir(0x09, 6, device=1) & 0b11 == 0b01  # Capture-IR reads ...01
                assert target.shift_dr(0, 32, device=1) == 0x0362D093
                # After reset every device selects IDCODE: device 0's leaves first.
                target.navigate(TapState.TEST_LOGIC_RESET)
                chain = target.shift_dr(0, 96)
                assert [(chain >> (32 * i)) & 0xFFFFFFFF for i in range(3)] == [c for c, _ in CHAIN]

                target.set_ir_length(2, 8)
                assert target.get_option("frequency") == "10000000"
                target.set_option("frequency", "1M")
                assert target.get_option("frequency") == "1000000"

                # Another session contends for the same cable.
                with jexjtag.Session() as other, other.open("jtag_sim", port=port) as rival:
                    with pytest.raises(JtagError, match="locked by another process"):
                        rival.lock(timeout_ms=0)
                assert target.is_locked
            assert not target.is_locked


def test_device_database_and_bsdl():
    with jexjtag.Session() as session:
        record = session.lookup(0x0362D093)
        assert (record.ir_length, record.bypass) == (6, "111111")
        assert session.lookup(0x12345679) is None
        session.add_device_data("00010010001101000101011001111001 6 7 0 my_part\n")
        assert session.lookup(0x12345679).name == "my_part"
        entity = session.bsdl(BSDL)
        assert entity.entity and entity.ir_length > 0 and len(entity.idcode) == 32


@pytest.mark.parametrize("target_type, args", [
    ("no_such_cable", {}),
    ("jtag_sim", {"chain": "0x4BA00477:1"}),  # an IR of 1 bit is refused
])
def test_failures_raise_jtagerror_with_the_libraries_message(caplog, target_type, args):
    caplog.set_level(logging.DEBUG, logger="jexjtag")
    with jexjtag.Session() as session:
        with pytest.raises(JtagError) as raised:
            session.open(target_type, **args)
        assert raised.value.function == "JexJtag_target_open"
        errors = [r.getMessage() for r in caplog.records if r.name == "jexjtag" and r.levelno == logging.ERROR]
        assert errors and raised.value.message == errors[-1]
        assert errors[-1] in str(raised.value)
    with pytest.raises(JtagError, match="closed"):
        session.targets()


@pytest.mark.parametrize("name, keep_going, outcome, checks, mismatches, line", [
    ("good-chain-idcodes.svf", False, "passed", 3, 0, 0),
    ("mismatch-idcode.svf", False, "mismatch", 2, 1, 10),
    ("mismatch-idcode.svf", True, "mismatch", 4, 1, 10),
    ("wrong-hex-digit.svf", False, "bad_file", 0, 0, 4),
])
def test_play_svf(name, keep_going, outcome, checks, mismatches, line):
    seen = []
    with jexjtag.Session() as session, session.open("jtag_sim", port=f"svf{os.getpid()}") as target, target.locked():
        path = os.path.join(TESTS, "svf", "data", name)
        if outcome == "passed":
            result = target.play_svf(path, progress=lambda *p: seen.append(p))
            assert seen and seen[-1][2] == result.statements
        else:
            with pytest.raises(jexjtag.SvfError) as raised:
                target.play_svf(path, keep_going=keep_going)
            result = raised.value.result
            assert result.message in str(raised.value) and f":{line}:" in result.message
        assert (result.outcome, result.checks, result.mismatches) == (outcome, checks, mismatches)
        assert line in (result.first_mismatch_line, result.error_line)


def levels(pins):
    return {pin.port: pin.level for pin in pins}


def test_pins_of_a_simulated_bsdl_part():
    part = os.path.join(TESTS, "e2e", "data", "board_part.bsd")
    with jexjtag.Session() as session, session.open("jtag_sim", port=f"pins{os.getpid()}", chain=f"bsdl={part}",
                                                    pins="0:IN1=1;0:10=1") as target, target.locked():
        pins = target.sample_pins(0, part)
        assert pins[0] == jexjtag.Pin("IN0", "5", "input", 0, 0)
        assert [(p.port, p.pin, p.function) for p in pins[2:]] == [
            ("OUT0", "7", "output3"), ("IO(0)", "9", "bidir"), ("IO(1)", "10", "bidir")]
        assert levels(pins) == {"IN0": 0, "IN1": 1, "OUT0": None, "IO(0)": 0, "IO(1)": 1}
        # Driven pins beat the board's levels; a released one shows the board's again.
        driven = levels(target.drive_pins(0, part, {"IO(0)": 1, "10": 0, "OUT0": None}))
        assert (driven["IO(0)"], driven["IO(1)"]) == (1, 0)
        target.highz(0, part)
        with pytest.raises(JtagError, match="JexJtag_bsdl_extest"):
            target.drive_pins(0, part, {"IN0": 1})  # an input has no driving cell
        assert levels(target.sample_pins(0, part))["IO(1)"] == 1
