"""The Python module on the RTL model behind OpenOCD (run by scripts/rtl-demo.sh, which sets
ZINMOX_OPENOCD_TARGET)."""
import os

import pytest
import zinmox

TARGET = os.environ["ZINMOX_OPENOCD_TARGET"]


def test_write_and_read_back_through_openocd():
    with zinmox.Session(TARGET) as session:
        assert len(session.scan()) == 4
        core = session.core("0:1:1").init()
        assert core.info["core_type"] == 9
        core.define("out", "async_out", list(range(8)))
        core.define("inp", "async_in", list(range(8)))
        for value in (0x00, 0xA5, 0x3C):
            core.write(out=value)
            assert core.read()["inp"].value == value


def test_errors_name_openocd():
    with pytest.raises(ValueError):
        zinmox.Session(TARGET + "?board=no-such-board.json")
    with pytest.raises(ConnectionError, match="IR length 5"):
        zinmox.Session(TARGET + '?board={"devices":[{"preset":"rtl-model","ir_length":5}]}')
