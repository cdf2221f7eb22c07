"""Sessions on a target server: `zinmox serve` in a child process, reached with
Session("tcp://HOST:PORT")."""

import os
import re
import select
import signal
import subprocess
import time

import pytest

import zinmox
from conftest import FULL


class Server:
    """`zinmox serve` on a free loopback port, in a child process."""

    def __init__(self, env=None):
        self.process = subprocess.Popen(
            [os.environ["ZINMOX_TOOL"], "serve", "--listen", "127.0.0.1:0"],
            stdout=subprocess.PIPE, stderr=subprocess.STDOUT, env=env)
        self.target = None
        output = b""
        deadline = time.monotonic() + 20
        while self.target is None and time.monotonic() < deadline:
            ready, _, _ = select.select([self.process.stdout], [], [], 1.0)
            if ready:
                chunk = os.read(self.process.stdout.fileno(), 4096)
                if not chunk:
                    break
                output += chunk
                found = re.search(rb"tcp://127\.0\.0\.1:\d+", output)
                self.target = found.group(0).decode() if found else None

    def stop(self):
        """SIGTERM; the server must stop cleanly."""
        if self.process.poll() is None:
            self.process.send_signal(signal.SIGTERM)
        return self.process.wait(timeout=10)


@pytest.fixture
def server():
    started = Server()
    try:
        assert started.target, "zinmox serve did not say where it listens"
        yield started
    finally:
        assert started.stop() == 0


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
        assert server.stop() == 0
        with pytest.raises(zinmox.Error, match="cannot connect to 127.0.0.1"):
            one.write(async_out_data=2)
    with pytest.raises(ConnectionError, match="cannot connect to 127.0.0.1"):
        zinmox.Session(server.target)


def test_a_token_server_takes_the_token_keyword():
    token = "python-token-0123456789"
    started = Server(env=dict(os.environ, ZINMOX_TOKEN=token))
    try:
        assert started.target
        with pytest.raises(ConnectionError, match="does not know the token"):
            zinmox.Session(started.target, token="another-token-0123456789")
        with zinmox.Session(started.target, token=token) as session:
            assert session.scan()
    finally:
        assert started.stop() == 0
