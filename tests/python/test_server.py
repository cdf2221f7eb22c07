"""Sessions on a target server: `zinmox serve` in a child process, reached with
Session("tcp://HOST:PORT")."""

import os
import re
import subprocess

import pytest

import zinmox
from conftest import FULL


def stop(process):
    """SIGTERM; the server must stop cleanly."""
    if process.poll() is None:
        process.terminate()
    return process.wait(timeout=10)


@pytest.fixture
def server():
    process = subprocess.Popen([os.environ["ZINMOX_TOOL"], "serve", "--listen", "127.0.0.1:0"],
                               stdout=subprocess.PIPE, text=True)
    try:
        found = next(filter(None, (re.search(r"tcp://127\.0\.0\.1:\d+", line)
                                   for line in process.stdout)), None)
        assert found, "zinmox serve did not say where it listens"
        process.target = found.group(0)
        yield process
    finally:
        assert stop(process) == 0


def test_sessions_share_the_served_target_and_a_stopped_server_is_reported(server):
    with pytest.raises(ValueError, match="is not HOST:PORT"):
        zinmox.Session("tcp://127.0.0.1")
    with zinmox.Session(server.target) as first, zinmox.Session(server.target) as second:
        assert first.target is None  # not a simulated target of this process
        one = first.core(FULL).init()
        two = second.core(FULL).init()
        one.write(async_out_data=0xA5C3)
        assert two.read()["async_in_data"].value == 0xA5C3
        assert first.scan() == second.scan()
        assert stop(server) == 0
        with pytest.raises(zinmox.Error, match="cannot connect to 127.0.0.1"):
            one.write(async_out_data=2)
    with pytest.raises(ConnectionError, match="cannot connect to 127.0.0.1"):
        zinmox.Session(server.target)
