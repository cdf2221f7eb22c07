"""Fixtures of the zinmox tests: sessions on the simulated demo design."""

import pytest

import zinmox

# The demo design's full-layout core: 16 async outputs, 8 sync outputs, 16 async inputs and
# 12 sync inputs; inputs loop back the outputs of the same kind, sync inputs 8-11 count cycles.
FULL = "0:1:0"


@pytest.fixture
def session():
    with zinmox.Session() as opened:
        yield opened


@pytest.fixture
def core(session):
    return session.core(FULL).init()
