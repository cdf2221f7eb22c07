"""Failures raise zinmox.Error with the session's messages of that call."""

import pytest

import zinmox
from conftest import FULL


def test_error_carries_the_messages_and_codes_of_the_call(session, core):
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
        "ZinMOX_initCore() for the wrong core type or non-existant core.",
        "Zin abort command",
    ]
    assert str(raised.value) == "\n".join(raised.value.texts)
    # The next call starts with no messages of its own.
    core.define("ok", "async_out", 0)


def test_failing_transfer_and_status_read(session, core):
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


def test_values_checked_before_any_call(core):
    core.define("ctl", "async_out", [0, 1])
    core.define("clk", "sync_out", [0])
    with pytest.raises(ValueError, match="16 steps"):
        core.write(clk=[0, 1])
    with pytest.raises(ValueError, match="a step of clk 'x' is not a hexadecimal number"):
        core.write(clk=["1"] * 15 + ["x"])
    with pytest.raises(ValueError, match="given twice"):
        core.write({"clk": [0] * 16, "clk.pulsetrain": "0"})
    with pytest.raises(ValueError, match="NUL"):
        core.define("a\0b", "async_out", 1)
    with pytest.raises(ValueError, match="NUL"):
        core.write(ctl="3\0ff")  # the library would stop reading at the NUL
    with pytest.raises(ValueError, match="unknown port"):
        core.define("x", "async", 1)


def test_simulated_target_numbers_stay_in_range(session):
    target = session.target
    with pytest.raises(ValueError, match="period must be 0 to 18446744073709551615"):
        target.set_input(FULL, "async_in", 0, {"kind": "square", "period": 2**64})
    target.advance(2**64 - 1 - target.cycle(FULL))
    with pytest.raises(OverflowError, match="past 2\\*\\*64-1"):
        target.advance(1)  # would wrap the cycle count to 0
    assert target.cycle(FULL) == 2**64 - 1
