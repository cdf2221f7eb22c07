"""Named writes and reads through the loopback of the demo design."""

import pytest

import zinmox
from conftest import FULL


def test_write_is_read_back_through_the_loopback(session, core):
    core.define("ctl", "async_out", [0, 1, 2, 3, 4, 5])
    core.define("wide", "async_out", list(range(6, 16)))
    core.define("status", "async_in", [0, 1, 2, 3, 4, 5])
    core.define("upper", "async_in", list(range(6, 16)))
    core.define("swapped", "async_in", [1, 0])  # value bit 0 is port bit 1
    core.write(ctl=0x21, wide=0x2A5)
    readings = core.read()
    assert readings["status"].value == 0x21
    assert readings["upper"].value == 0x2A5
    assert readings["swapped"].value == 0b10  # port bits 1, 0 = 0, 1
    assert readings["async_in_data"].value == (0x2A5 << 6) | 0x21
    assert session.target.levels(FULL, "async_out") == (0x2A5 << 6) | 0x21
    # A dict with hex texts, which are passed on as they are: "8" is sign-extended.
    core.write({"ctl": "15", "wide": "8"})
    readings = core.read()
    assert readings["status"].value == 0x15
    assert readings["upper"].value == 0x3F8  # FFF8 cut to the 10 bits of the bus


def test_write_of_ints_is_checked_against_the_width(core):
    core.define("ctl", "async_out", [0, 1, 2])
    core.write(ctl=7)
    with pytest.raises(ValueError, match="does not fit in 3 bits"):
        core.write(ctl=8)
    with pytest.raises(ValueError, match="must not be negative"):
        core.write(ctl=-1)
    core.define("back", "async_in", [0, 1, 2])
    assert core.read()["back"].value == 7  # the refused writes sent nothing
    core.write(ctl=True)
    assert core.read()["back"].value == 1


def test_pulse_trains_as_lists_texts_and_numbers(session, core):
    core.define("start", "sync_out", [0, 1])
    core.define("seen", "sync_in", [0, 1])
    steps = [1, 2, 3, 0, 1, 1, 2, 2, 3, 3, 0, 0, 1, 2, "3", "0"]
    core.write(start=steps)
    # One cycle passes with each command sequence: the read right after the write sees step 0,
    # and step 15 is held afterwards.
    seen = [core.read()["seen"].value for _ in range(17)]
    assert seen == [int(str(step), 16) for step in steps] + [0]
    # A plain int holds one level on every step, which the target drives at once.
    core.write(start=2)
    session.target.advance(1)
    assert session.target.levels(FULL, "sync_out") & 0b11 == 2
    # As one number or text, step t is byte t (one byte per step for a 1-bit signal).
    core.define("bit", "sync_out", 7)
    core.define("back", "sync_in", 7)
    core.write({"bit.pulsetrain": sum(1 << (8 * t) for t in (0, 2, 3))})
    assert [core.read()["back"].value for _ in range(5)] == [1, 0, 1, 1, 0]
    core.write({"bit.pulsetrain": format(1 << 8, "x")})
    assert [core.read()["back"].value for _ in range(3)] == [0, 1, 0]


def test_readings_map_activity_and_sync_activity_only_on_sync_inputs(session, core):
    core.define("line", "async_out", 3)
    core.define("line_in", "async_in", 3)
    core.define("clocked", "sync_out", 2)
    core.define("clocked_in", "sync_in", 2)
    core.read()  # clears what starting up left
    core.write(line=1)
    rose = core.read()["line_in"]
    assert (rose.value, rose.activity_up, rose.activity_down) == (1, 1, 0)
    assert rose.sync_activity_up is None and rose.sync_activity_down is None
    # A one-step pulse on a synchronous output: sync activity sees it rise and fall.
    core.write(clocked=[1] + [0] * 15)
    session.target.advance(5)
    pulse = core.read()["clocked_in"]
    assert (pulse.value, pulse.sync_activity_up, pulse.sync_activity_down) == (0, 1, 1)
    assert core.read()["clocked_in"] == zinmox.Reading(0, 0, 0, 0, 0)


def test_read_keeps_names_with_dots_and_reports_every_input(core):
    core.define("bus.low", "async_in", [0, 1])
    readings = core.read()
    assert set(readings) == {"bus.low", "async_in_data", "sync_in_data"}
    assert readings["sync_in_data"].sync_activity_up is not None
    assert "value=" in repr(readings["bus.low"])
