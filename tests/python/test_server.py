"""`zinmox serve` in a child process holds the target for several clients: Python sessions with
Session("tcp://HOST:PORT") and `zinmox --target tcp://HOST:PORT` processes."""

import os
import re
import subprocess

import pytest

import zinmox
from conftest import FULL

TOOL = os.environ["ZINMOX_TOOL"]


def tool(*args):
    return subprocess.run([TOOL, *args], capture_output=True, text=True, timeout=60, check=False)


def stop(process):
    """SIGTERM; the server must stop cleanly and say so."""
    if process.poll() is None:
        process.terminate()
    assert process.wait(timeout=10) == 0
    assert "stopping on SIGTERM" in process.stdout.read()


def serve(env=None):
    """`zinmox serve` on a free loopback port; its first lines say where and how it listens."""
    process = subprocess.Popen([TOOL, "serve", "--listen", "127.0.0.1:0"],
                               stdout=subprocess.PIPE, text=True, env=env)
    process.lines = process.stdout.readline() + process.stdout.readline()  # listening, serving
    found = re.search(r"tcp://127\.0\.0\.1:\d+", process.lines)
    process.target = found.group(0) if found else None
    return process


@pytest.fixture
def server():
    process = serve()
    try:
        assert process.target and "loopback only" in process.lines, process.lines
        yield process
    finally:
        if process.poll() is None:
            stop(process)


def test_sessions_and_tool_processes_share_the_served_target(server):
    with zinmox.Session(server.target) as first, zinmox.Session(server.target) as second:
        assert first.target is None  # not a simulated target of this process
        one = first.core(FULL).init()
        two = second.core(FULL).init()
        one.write(async_out_data=0xA5C3)
        assert two.read()["async_in_data"].value == 0xA5C3
        assert first.scan() == second.scan()
        written = tool("--target", server.target, "write", FULL, "async_out_data=5AC3")
        assert written.returncode == 0, written.stderr
        assert one.read()["async_in_data"].value == 0x5AC3
        read = tool("--target", server.target, "read", FULL, "async_in_data")
        assert read.returncode == 0 and "5AC3" in read.stdout, read.stderr
        # A stopped server is reported by both clients.
        stop(server)
        with pytest.raises(zinmox.Error, match="cannot connect to 127.0.0.1"):
            one.write(async_out_data=2)
    with pytest.raises(ConnectionError, match="cannot connect to 127.0.0.1"):
        zinmox.Session(server.target)
    late = tool("--target", server.target, "scan")
    assert late.returncode == 1 and "cannot connect to 127.0.0.1" in late.stderr


def test_a_token_server_takes_the_token_keyword():
    token = "python-token-0123456789"
    process = serve(env=dict(os.environ, ZINMOX_TOKEN=token))
    try:
        assert process.target, process.lines
        with pytest.raises(ConnectionError, match="does not know the token"):
            zinmox.Session(process.target, token="another-token-0123456789")
        with zinmox.Session(process.target, token=token) as session:
            assert session.scan()
    finally:
        stop(process)
