"""Whole-port writes and reads with packed bytes."""

import pytest

from conftest import FULL


def test_ports_round_trip_with_masks_and_steps(session, core):
    core.ports.read()  # clears the activity of starting up
    core.ports.write(async_out=b"\x34\x12")
    ports = core.ports.read()
    assert ports["async_in"] == b"\x34\x12"
    assert ports["async_in_activity_up"] == b"\x34\x12"
    # Only the masked bits change.
    core.ports.write(async_out=b"\xff\xff", async_mask=b"\x0f\x00")
    assert core.ports.read()["async_in"] == b"\x3f\x12"
    # 16 step vectors of one byte: bit 0 high on even steps.
    steps = bytes(0x01 if t % 2 == 0 else 0x00 for t in range(16))
    core.ports.write(sync_out=steps)
    seen = [core.ports.read()["sync_in"][0] & 1 for _ in range(4)]
    assert seen == [1, 0, 1, 0]
    # 12 synchronous inputs: two bytes, the spare high bits of the last one cleared.
    ports = core.ports.read()
    assert len(ports["sync_in"]) == 2 and ports["sync_in"][1] & 0xF0 == 0
    assert set(ports) == {"async_in", "async_in_activity_up", "async_in_activity_down", "sync_in",
                          "sync_in_activity_up", "sync_in_activity_down",
                          "sync_in_sync_activity_up", "sync_in_sync_activity_down"}
    assert session.target.levels(FULL, "async_out") == 0x123F


def test_port_vectors_must_have_the_port_size(core):
    with pytest.raises(ValueError, match="async_out must be 2 bytes long, not 1"):
        core.ports.write(async_out=b"\x01")
    with pytest.raises(ValueError, match="sync_out must be 16 bytes long"):
        core.ports.write(sync_out=b"\x01")
    with pytest.raises(ValueError, match="without async_out"):
        core.ports.write(async_mask=b"\xff\xff")
    core.ports.write(async_out=bytearray(b"\x01\x00"))
    assert core.ports.read()["async_in"] == b"\x01\x00"
