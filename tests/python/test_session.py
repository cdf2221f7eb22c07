"""Sessions: targets, the context manager, scanning, core references and threads."""

import json
import subprocess
import sys
import threading

import pytest

import zinmox

SMALL = {
    "devices": [{"index": 2, "chains": [{"number": 3, "cores": [
        {"index": 1, "async_outputs": 4, "async_inputs": 4, "sync_outputs": 1, "sync_inputs": 1},
        {"index": 2, "type": 5, "status": "12"},
    ]}]}]
}


def test_context_manager_closes_the_session():
    with zinmox.Session() as session:
        core = session.core("0:1:1").init()
        assert not session.closed and session.handle != 0
    assert session.closed and session.handle == 0
    with pytest.raises(zinmox.Error, match="^The session is closed.$"):
        core.read()
    with pytest.raises(zinmox.Error, match="closed"):
        session.scan()
    session.close()  # closing again does nothing
    # An exception inside the block closes the session as well and is not swallowed.
    with pytest.raises(KeyError):
        with zinmox.Session() as failing:
            raise KeyError("x")
    assert failing.closed
    # The simulated target outlives the session for inspection.
    assert failing.target.flush_count == 0


def test_targets_scan_and_references(tmp_path):
    with zinmox.Session() as session:
        cores = session.scan()
        assert [entry["ref"] for entry in cores] == [(0, 1, 0), (0, 1, 1), (0, 1, 2), (0, 1, 3)]
        assert [entry["mox"] for entry in cores] == [True, True, True, False]
        assert cores[3]["info"] is None
        info = cores[0]["info"]
        assert (info["core_major_version"], info["async_output_count"]) == (10, 16)
        # Texts are checked with the tool's rules (test_client_cases.py), sequences alike.
        assert session.core([0, 1, 3]).ref == (0, 1, 3)
        assert repr(session.core((0, 1, 0))) == "<zinmox.Core 0:1:0>"
        for bad in ((0, 1, -1), (256, 0, 0), (0, 16, 0), (0, 1)):
            with pytest.raises(ValueError):
                session.core(bad)
    path = tmp_path / "board.json"
    path.write_text(json.dumps(SMALL))
    for target in (SMALL, path, str(path)):
        with zinmox.Session(target) as session:
            core = session.core("0x2:3:0x1").init()
            assert core.info["async_output_count"] == 4 and len(core.info) == 12
            assert [entry["mox"] for entry in session.scan()] == [True, False]
    with zinmox.Session(path) as session:
        assert "board.json" in repr(session)
    with pytest.raises(ValueError, match="/devices/0/chains/0/cores/0/async_outputs"):
        zinmox.Session({"devices": [{"chains": [{"cores": [{"async_outputs": 70000}]}]}]})
    with pytest.raises(ValueError, match="missing.json"):
        zinmox.Session(str(tmp_path / "missing.json"))


def test_calls_from_several_threads_and_close_during_a_call():
    # Calls release the GIL; each thread works on its own core and sees its own values (core 2
    # has a square wave on async input 3, so only its bits 0 to 2 loop back).
    session = zinmox.Session()
    failures, closed = [], []

    def work(ref, width):
        try:
            core = session.core(ref).init()
            core.define("out", "async_out", list(range(width)))
            core.define("back", "async_in", list(range(width)))
            for value in range(200):
                core.write(out=value % (1 << width))
                if core.read()["back"].value != value % (1 << width):
                    failures.append((ref, value))
        except Exception as error:  # reported below
            failures.append(error)

    def reader(core, started):
        try:
            while True:
                core.read()
                started.set()
        except zinmox.Error as error:
            closed.append(str(error))

    threads = [threading.Thread(target=work, args=(ref, width))
               for ref, width in (("0:1:0", 16), ("0:1:1", 8), ("0:1:2", 3))]
    for thread in threads:
        thread.start()
    for thread in threads:
        thread.join()
    assert failures == []
    # Closing waits for a call that runs in another thread; the next call says so.
    started = threading.Event()
    thread = threading.Thread(target=reader, args=(session.core("0:1:0").init(), started))
    thread.start()
    assert started.wait(10)
    session.close()
    thread.join(10)
    assert not thread.is_alive() and closed == ["The session is closed."]


def test_interpreter_exit_with_daemon_threads_inside_calls():
    # Threads still inside library calls when the interpreter exits end quietly: taking the GIL
    # back there must not unwind through a noexcept frame, which would abort the process.
    script = """if True:
        import threading, time, zinmox
        session = zinmox.Session()
        def work():
            core = session.core("0:1:0").init()
            while True:
                core.read()
                session.target.advance(1000)
        for _ in range(4):
            threading.Thread(target=work, daemon=True).start()
        time.sleep(0.05)
        """
    for _ in range(5):
        result = subprocess.run([sys.executable, "-c", script], capture_output=True, text=True,
                                timeout=60, check=False)
        assert result.returncode == 0, result.stderr
