#!/usr/bin/env python3
"""A small test bench on the simulated demo design.

Names a control bus and a clocked output, drives them, and reads them back through the
design's loopback: values, a 16-step pulse train seen cycle by cycle, and activity.

Run from the repository root after building:
    PYTHONPATH=build/python /usr/bin/python3 python/examples/pulse_bench.py
"""

import logging
import sys

import zinmox

CORE = "0:1:0"  # the demo's full-layout MOX core: inputs loop back outputs of the same kind


def main() -> int:
    logging.basicConfig(level=logging.INFO, format="%(name)s: %(message)s")
    with zinmox.Session() as session:
        for entry in session.scan():
            kind = "MOX core" if entry["mox"] else "other core"
            print(f"core {entry['ref']}: {kind}")

        core = session.core(CORE).init()
        info = core.info
        print(f"\ncore {CORE}: version {info['core_major_version']}.{info['core_minor_version']},"
              f" {info['async_output_count']} async outputs,"
              f" {info['sync_output_count']} sync outputs")

        core.define("ctl", "async_out", [0, 1, 2, 3, 4, 5])
        core.define("status", "async_in", [0, 1, 2, 3, 4, 5])
        core.define("strobe", "sync_out", 0)
        core.define("strobe_seen", "sync_in", 0)

        core.write(ctl=0x2A)
        print(f"\nwrote ctl=0x2A, read back status={core.read()['status'].value:#x}")

        steps = [1, 0, 0, 1, 1, 0, 1, 0, 0, 0, 0, 0, 0, 0, 0, 0]
        core.write(strobe=steps)
        seen = [core.read()["strobe_seen"].value for _ in range(len(steps))]
        print(f"pulse train {steps}\n      seen  {seen}")

        core.read()  # clears the activity latches
        core.write(ctl=0x2B)
        core.write(ctl=0x2A)  # bit 0 pulses between two reads
        reading = core.read()["status"]
        print(f"activity after a short pulse on bit 0: up={reading.activity_up:#x}"
              f" down={reading.activity_down:#x}")

        target = session.target
        target.set_input(CORE, "async_in", 6, {"kind": "square", "period": 4})
        levels = []
        for _ in range(8):
            levels.append(target.levels(CORE, "async_in") >> 6 & 1)
            target.advance(1)
        print(f"square wave on async input 6, cycle by cycle: {levels}")

        try:
            core.write(missing=1)
        except zinmox.Error as error:
            print(f"\nzinmox.Error from {error.function}: {error} (codes {error.codes})")
    return 0 if seen == steps else 1


if __name__ == "__main__":
    sys.exit(main())
