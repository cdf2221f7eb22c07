"""The API refuses what it cannot use with a 4xx and a clear message, and keeps serving."""

import pytest

CORE = "/api/cores/0:1:0"


def named(**fields):
    """A define or undefine body: x on async_out bit 0 unless `fields` say otherwise."""
    return {"name": "x", "port": "async_out", "bits": "0", **fields}


# (method, path, JSON body or raw bytes, extra headers, status, words of the message)
CASES = [
    ("POST", CORE + "/write", {"values": {"leds": "XZ"}}, None, 400, "not a hexadecimal"),
    ("POST", CORE + "/write", {"values": {"nope": "1"}}, None, 404, "unknown output 'nope'"),
    ("POST", CORE + "/write", {"values": {"leds.train": "1"}}, None, 400, "unknown suffix"),
    ("POST", CORE + "/write", {"values": {"leds": 5}}, None, 400, "must be a hex text"),
    ("POST", CORE + "/write", {"values": {}}, None, 400, "nothing to write"),
    ("POST", CORE + "/write", {"value": {}}, None, 400, "unknown key 'value'"),
    ("POST", CORE + "/undefine", {"name": "ghost", "port": "async_out"}, None, 404, "no name"),
    ("POST", CORE + "/define", named(port="async_outs"), None, 400, "unknown port"),
    ("POST", CORE + "/define", named(bits="0-99"), None, 422, "could not define"),
    ("POST", CORE + "/define", named(name="1x"), None, 400, "bad name"),
    ("POST", CORE + "/define", named(name="x" * 65), None, 400, "1 to 64 characters"),
    ("POST", CORE + "/define", named(bits=[-1]), None, 400, "bits"),
    ("POST", "/api/cores/0:1:3/define", named(), None, 404, "no MOX core at 0:1:3"),
    ("POST", "/api/cores/zz/write", {"values": {"a": "1"}}, None, 400, "malformed core"),
    ("POST", "/api/live", b"{bad", None, 400, "not valid JSON"),
    ("POST", "/api/live", b"[1]", None, 400, "must be a JSON object"),
    ("POST", "/api/live", {"rate_hz": 0.5}, None, 400, "between 1 and 50"),
    ("POST", "/api/live", {"rate_hz": 51}, None, 400, "between 1 and 50"),
    ("POST", "/api/live", {"paused": "yes"}, None, 400, "true or false"),
    ("POST", "/api/live", {"core": "0:1:3"}, None, 404, "no MOX core at 0:1:3"),
    ("POST", "/api/live", {"core": "0:2:0"}, None, 404, "no MOX core at 0:2:0"),
    ("POST", "/api/live", {"core": "0:1"}, None, 400, "malformed core"),
    ("POST", "/api/live", b"{" + b" " * 16382 + b"}", None, 200, ""),  # the largest body
    ("POST", "/api/live", b"{" + b" " * 16383 + b"}", None, 413, "larger than 16384 bytes"),
    ("POST", "/api/live", b"{}", {"Content-Type": "text/plain"}, 415, "application/json"),
    ("POST", "/api/live", {}, {"Origin": "http://evil.example"}, 403, "cross-origin write"),
    ("POST", "/api/live", {}, {"Host": "evil.example"}, 403, "Host header"),
    ("GET", "/api/nothing", None, None, 404, "no such page"),
]


@pytest.fixture
def defined(dashboard):
    assert dashboard.request("POST", CORE + "/define", named(name="leds", bits="0-7"))[0] == 200
    return dashboard


def test_bad_requests_get_a_4xx_with_a_message(defined):
    for method, path, body, headers, status, words in CASES:
        raw = body if isinstance(body, bytes) else None
        got, reply = defined.request(method, path, None if raw else body, headers, raw)
        assert got == status, (path, body, reply)
        if words:
            assert words in reply["error"], (path, reply)
    # Still serving, and nothing of the refused writes took effect.
    status, details = defined.request("GET", CORE)
    assert status == 200 and details["outputs"] == {}
    assert [n["name"] for n in details["names"] if not n["reserved"]] == ["leds"]
    assert defined.request("GET", "/")[0] == 200
