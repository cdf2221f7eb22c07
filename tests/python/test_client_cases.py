"""The Python half of the shared client cases (tests/tools/client_cases.json): the module accepts
and refuses the same reference, value, bit-list, name and target texts as the zinmox tool."""

import json
import pathlib
import re

import pytest

import zinmox

CASES = json.loads(
    (pathlib.Path(__file__).parents[1] / "tools" / "client_cases.json").read_text())


def outcome(entry, call):
    """Runs `call`; a refused text raises ValueError with the expected message."""
    if "error" in entry:
        with pytest.raises(ValueError, match=re.escape(entry["error"])):
            call()
        return None
    return call()


@pytest.mark.parametrize("entry", CASES["refs"], ids=lambda e: e["text"])
def test_references(session, entry):
    core = outcome(entry, lambda: session.core(entry["text"]))
    if core is not None:
        assert core.ref == tuple(entry["ref"])
    if "ref" in entry:  # a tuple of the same numbers is checked by the same limits
        assert session.core(tuple(entry["ref"])).ref == tuple(entry["ref"])


@pytest.mark.parametrize("entry", CASES["values"], ids=lambda e: e["text"] or "empty")
def test_values(core, entry):
    core.define("wide", "async_out", "0-9")
    core.define("wide_in", "async_in", "0-9")
    outcome(entry, lambda: core.write(wide=entry["text"]))
    if "reads" in entry:
        assert core.read()["wide_in"].value == int(entry["reads"], 16)


@pytest.mark.parametrize("entry", CASES["bits"] + CASES["names"], ids=lambda e: e["text"])
def test_bit_lists_and_names(core, entry):
    if "width" in entry or entry in CASES["bits"]:
        outcome(entry, lambda: core.define("x", "async_out", entry["text"]))
        if "width" in entry:
            assert core.sizes("x") == entry["width"]
    else:
        outcome(entry, lambda: core.define(entry["text"], "async_out", 0))


@pytest.mark.parametrize("entry", CASES["targets"], ids=lambda e: e["text"])
def test_targets(entry):
    outcome(entry, lambda: zinmox.Session(entry["text"]))
