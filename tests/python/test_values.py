"""Named and whole-port writes and reads through the demo design's loopback, the test-bench
access to the simulated target, and what the module refuses before any call."""

import pytest

import zinmox
from conftest import FULL


def test_ints_texts_and_readings(session, core):
    for name, port, bits in [("ctl", "async_out", range(6)), ("wide", "async_out", range(6, 16)),
                             ("status", "async_in", range(6)), ("upper", "async_in", range(6, 16)),
                             ("swapped", "async_in", [1, 0]), ("bus.low", "async_in", [0, 1])]:
        core.define(name, port, list(bits))  # swapped: value bit 0 is port bit 1
    core.read()  # clears what starting up left
    core.write(ctl=0x21, wide=0x2A5)
    readings = core.read()
    assert (readings["status"].value, readings["upper"].value) == (0x21, 0x2A5)
    assert readings["swapped"].value == 0b10  # port bits 1, 0 = 0, 1
    assert readings["async_in_data"].value == (0x2A5 << 6) | 0x21
    assert (readings["status"].activity_up, readings["status"].activity_down) == (0x21, 0)
    assert readings["status"].sync_activity_up is None  # only sync inputs have sync activity
    assert readings["sync_in_data"].sync_activity_up is not None
    assert set(readings) == {"status", "upper", "swapped", "bus.low", "async_in_data",
                             "sync_in_data"}
    assert "value=" in repr(readings["bus.low"])
    assert session.target.levels(FULL, "async_out") == (0x2A5 << 6) | 0x21
    # A dict with hex texts, which are passed on as they are: "8" is sign-extended.
    core.write({"ctl": "15", "wide": "8"})
    readings = core.read()
    assert (readings["status"].value, readings["upper"].value) == (0x15, 0x3F8)
    # An int is checked against the width of its signal; a refused write sends nothing.
    core.write(wide=0x3FF)
    with pytest.raises(ValueError, match="does not fit in 10 bits"):
        core.write(wide=0x400)
    with pytest.raises(ValueError, match="must not be negative"):
        core.write(wide=-1)
    assert core.read()["upper"].value == 0x3FF
    core.write(ctl=True)
    assert core.read()["status"].value == 1


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
    # A one-step pulse: sync activity sees it rise and fall, and the read clears it.
    core.define("clocked", "sync_out", 2)
    core.define("clocked_in", "sync_in", 2)
    core.write(clocked=[1] + [0] * 15)
    session.target.advance(5)
    pulse = core.read()["clocked_in"]
    assert (pulse.value, pulse.sync_activity_up, pulse.sync_activity_down) == (0, 1, 1)
    assert core.read()["clocked_in"] == zinmox.Reading(0, 0, 0, 0, 0)


def test_ports_round_trip_with_masks_and_steps(session, core):
    core.ports.read()  # clears the activity of starting up
    core.ports.write(async_out=b"\x34\x12")
    ports = core.ports.read()
    assert ports["async_in"] == ports["async_in_activity_up"] == b"\x34\x12"
    # Only the masked bits change.
    core.ports.write(async_out=bytearray(b"\xff\xff"), async_mask=b"\x0f\x00")
    assert core.ports.read()["async_in"] == b"\x3f\x12"
    # 16 step vectors of one byte: bit 0 high on even steps.
    core.ports.write(sync_out=bytes(0x01 if t % 2 == 0 else 0x00 for t in range(16)))
    assert [core.ports.read()["sync_in"][0] & 1 for _ in range(4)] == [1, 0, 1, 0]
    # 12 synchronous inputs: two bytes, the spare high bits of the last one cleared.
    ports = core.ports.read()
    assert len(ports["sync_in"]) == 2 and ports["sync_in"][1] & 0xF0 == 0
    assert set(ports) == {"async_in", "async_in_activity_up", "async_in_activity_down", "sync_in",
                          "sync_in_activity_up", "sync_in_activity_down",
                          "sync_in_sync_activity_up", "sync_in_sync_activity_down"}
    assert session.target.levels(FULL, "async_out") == 0x123F


def test_input_sources_and_time(session, core):
    target = session.target
    core.define("probe", "async_in", [0, 1])
    core.read()
    target.set_input(FULL, "async_in", 0, 1)
    target.set_input(FULL, "async_in", 1, {"kind": "square", "period": 4})
    reading = core.read()["probe"]
    assert reading.value & 1 == 1 and reading.activity_up & 1 == 1
    start = target.cycle(FULL)
    target.advance(10)
    assert target.cycle(FULL) == start + 10
    # The square wave is high for cycles 2 and 3 of every 4.
    levels = []
    for _ in range(4):
        levels.append(target.levels(FULL, "async_in") >> 1 & 1)
        target.advance(1)
    assert sorted(levels) == [0, 0, 1, 1]
    target.set_input(FULL, "sync_in", 0, {"kind": "loopback", "output": "async", "bit": 5})
    core.define("five", "async_out", 5)
    core.define("sampled", "sync_in", 0)
    core.write(five=1)
    target.advance(1)
    assert core.read()["sampled"].value == 1
    target.set_cycles_per_sequence(0)
    before = target.cycle(FULL)
    core.read()
    assert target.cycle(FULL) == before
    assert any(" 03 1 " in line for line in target.command_log()[-1].split("\n"))
    target.advance(2**64 - 1 - target.cycle(FULL))
    with pytest.raises(OverflowError, match="past 2\\*\\*64-1"):
        target.advance(1)  # would wrap the cycle count to 0
    assert target.cycle(FULL) == 2**64 - 1


def test_errors_carry_the_messages_and_codes_of_the_call(session, core):
    assert issubclass(zinmox.Error, RuntimeError)
    with pytest.raises(zinmox.Error) as raised:
        core.write({"nothing": "1"})
    assert str(raised.value) == "Could not find a signal with the name: nothing"
    assert raised.value.function == "ZinMOX_writeValues"
    assert raised.value.messages == [(256, "Could not find a signal with the name: nothing")]
    # Wrong core type: two messages, the second with the abort code.
    with pytest.raises(zinmox.Error) as raised:
        session.core("0:1:3").init()
    assert raised.value.codes == [256, 32768]
    assert raised.value.texts == [
        "ZinMOX_initCore() for the wrong core type or non-existant core.", "Zin abort command"]
    assert str(raised.value) == "\n".join(raised.value.texts)
    # Failing transfers and status reads of the target; the next call works.
    core.define("ctl", "async_out", 0)
    session.target.fail_next_transfer("cable unplugged")
    with pytest.raises(zinmox.Error, match="^cable unplugged$"):
        core.write(ctl=1)
    assert session.target.levels(FULL, "async_out") == 0
    session.target.fail_next_status_read("no answer")
    with pytest.raises(zinmox.Error, match="no answer"):
        core.info
    core.write(ctl=1)
    assert session.target.levels(FULL, "async_out") == 1


def test_refused_arguments_raise_before_any_call(session, core):
    core.define("ctl", "async_out", [0, 1])
    core.define("clk", "sync_out", 0)
    target = session.target
    wrong_types = [
        lambda: zinmox.Session(42), lambda: zinmox.Session([1, 2]), lambda: session.core(0),
        lambda: session.core(None), lambda: session.core((0, "1", 0)),
        lambda: session.core((0, 1.0, 0)), lambda: core.define(5, "async_out", 1),
        lambda: core.define("x", 2, 1), lambda: core.define("x", "async_out", b"1"),
        lambda: core.define(b"a", "async_out", 1), lambda: core.define("x", "async_out", 1.5),
        lambda: core.define("x", "async_out", [1, None]), lambda: core.undefine(None, "async_out"),
        lambda: core.sizes(5), lambda: core.sizes(["ctl", 5]), lambda: core.write(ctl=1.0),
        lambda: core.write(ctl=None), lambda: core.write(ctl=b"3"), lambda: core.write({1: 1}),
        lambda: core.write([("ctl", 1)]), lambda: core.write(clk=[0] * 15 + [None]),
        lambda: core.ports.write(async_out="00"), lambda: core.ports.write(async_out=[0, 0]),
        lambda: core.ports.write(b"\0\0"), lambda: target.advance("1"),
        lambda: target.set_input(FULL, "async_in", 0, "1"), lambda: target.levels(FULL, None),
    ]
    cases = [(TypeError, "", call) for call in wrong_types] + [
        (ValueError, "16 steps", lambda: core.write(clk=[0, 1])),
        (ValueError, "a step of clk 'x' is not a hexadecimal number",
         lambda: core.write(clk=["1"] * 15 + ["x"])),
        (ValueError, "given twice", lambda: core.write({"clk": [0] * 16, "clk.pulsetrain": "0"})),
        (ValueError, "NUL", lambda: core.define("a\0b", "async_out", 1)),
        (ValueError, "NUL", lambda: core.write(ctl="3\0ff")),  # the library stops at a NUL
        (ValueError, "unknown port", lambda: core.define("x", "async", 1)),
        (ValueError, "async_out must be 2 bytes long, not 1",
         lambda: core.ports.write(async_out=b"\x01")),
        (ValueError, "sync_out must be 16 bytes long", lambda: core.ports.write(sync_out=b"\x01")),
        (ValueError, "without async_out", lambda: core.ports.write(async_mask=b"\xff\xff")),
        (ValueError, "", lambda: target.set_input(FULL, "async_in", 99, 0)),
        (ValueError, "unknown key",
         lambda: target.set_input(FULL, "async_in", 0, {"kind": "constant", "level": 1})),
        (ValueError, "", lambda: target.levels("0:1:3", "async_out")),
        (ValueError, "period must be 0 to 18446744073709551615",
         lambda: target.set_input(FULL, "async_in", 0, {"kind": "square", "period": 2**64})),
    ]
    for kind, words, call in cases:
        with pytest.raises(kind, match=words):
            call()
    # Nothing was written by the refused calls, and the session still works.
    assert target.command_log() == []
    core.write(ctl=3)
    assert core.sizes("ctl") == 2 and core.sizes(("ctl", "clk")) == [2, 1]
