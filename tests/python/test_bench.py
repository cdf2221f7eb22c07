"""Test-bench access to the simulated target: input sources, time, output levels."""

import pytest

from conftest import FULL


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
    with pytest.raises(ValueError):
        target.set_input(FULL, "async_in", 99, 0)
    with pytest.raises(ValueError, match="unknown key"):
        target.set_input(FULL, "async_in", 0, {"kind": "constant", "level": 1})
    with pytest.raises(ValueError):
        target.levels("0:1:3", "async_out")
