"""Fixtures of the dashboard tests: a `zinmox dashboard` process on a free loopback port."""

import json
import os
import re
import subprocess
import urllib.error
import urllib.request

import pytest

TOOL = os.environ.get("ZINMOX_TOOL", "zinmox")


class Dashboard:
    """A running dashboard and a small client of its API."""

    def __init__(self, process, address):
        self.process = process
        self.address = address
        self.url = f"http://{address}"

    def request(self, method, path, body=None, headers=None, raw=None):
        """(status, decoded JSON or text) of one request; bodies are JSON unless raw."""
        data = raw if raw is not None else (None if body is None else json.dumps(body).encode())
        sent = {"Content-Type": "application/json"} if data is not None else {}
        sent.update(headers or {})
        request = urllib.request.Request(self.url + path, data=data, method=method, headers=sent)
        try:
            with urllib.request.urlopen(request, timeout=10) as response:
                status, text = response.status, response.read().decode()
        except urllib.error.HTTPError as error:
            status, text = error.code, error.read().decode()
        try:
            return status, json.loads(text)
        except ValueError:
            return status, text


@pytest.fixture
def dashboard():
    process = subprocess.Popen([TOOL, "dashboard", "--listen", "127.0.0.1:0"],
                               stdout=subprocess.PIPE, stderr=subprocess.STDOUT, text=True)
    try:
        line = process.stdout.readline()  # the first line names the bound address
        match = re.search(r"http://(127\.0\.0\.1:\d+)/", line)
        assert match, f"the dashboard did not start: {line!r}"
        yield Dashboard(process, match.group(1))
    finally:
        process.terminate()
        try:
            assert process.wait(timeout=10) == 0
        finally:
            process.kill() if process.poll() is None else None
