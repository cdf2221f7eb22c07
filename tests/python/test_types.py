"""Arguments of the wrong type raise TypeError instead of crashing."""

import pytest

import zinmox


def test_wrong_argument_types_raise_type_error(session, core):
    core.define("ctl", "async_out", [0, 1])
    core.define("clk", "sync_out", 0)
    calls = [
        lambda: zinmox.Session(42),
        lambda: zinmox.Session([1, 2]),
        lambda: session.core(0),
        lambda: session.core(None),
        lambda: session.core((0, "1", 0)),
        lambda: session.core((0, 1.0, 0)),
        lambda: core.define(5, "async_out", 1),
        lambda: core.define("x", 2, 1),
        lambda: core.define("x", "async_out", b"1"),
        lambda: core.define(b"a", "async_out", 1),
        lambda: core.define("x", "async_out", [1, None]),
        lambda: core.define("x", "async_out", 1.5),
        lambda: core.undefine(None, "async_out"),
        lambda: core.sizes(5),
        lambda: core.sizes(["ctl", 5]),
        lambda: core.write(ctl=1.0),
        lambda: core.write(ctl=None),
        lambda: core.write(ctl=b"3"),
        lambda: core.write({1: 1}),
        lambda: core.write([("ctl", 1)]),
        lambda: core.write(clk=[0] * 15 + [None]),
        lambda: core.ports.write(async_out="00"),
        lambda: core.ports.write(async_out=[0, 0]),
        lambda: core.ports.write(b"\0\0"),
        lambda: session.target.advance("1"),
        lambda: session.target.set_input("0:1:0", "async_in", 0, "1"),
        lambda: session.target.levels("0:1:0", None),
    ]
    for index, call in enumerate(calls):
        with pytest.raises(TypeError):
            call()
            pytest.fail(f"call {index} accepted its arguments")
    # Nothing was written by the refused calls, and the session still works.
    assert session.target.command_log() == []
    core.write(ctl=3)
    assert core.sizes("ctl") == 2 and core.sizes(("ctl", "clk")) == [2, 1]
