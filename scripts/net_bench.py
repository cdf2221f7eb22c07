#!/usr/bin/env python3
"""Latency and load benchmarks of the target server (`zinmox serve`) on loopback.

Each run starts its own `zinmox serve` on a free loopback port, waits for its first line, and
always stops it (also when a client fails or the script is interrupted).

  latency  One client, interleaving a ping (the raw round trip through the server, which does
           not touch the target) with a named write, a named read, setPortBits and getPortBits
           on the demo design's small core. Prints p50 and p99 of each and p50 against the
           ping's. --runs repeats it with a fresh server each time (the machine is shared:
           compare the runs, keep the quietest).
  load     For each client count (default 1, 4, 16, 64), that many client processes each own
           one output bit of a 64-bit core whose inputs loop back its outputs, and do
           write-and-read pairs for --seconds. Prints the calls/s in all, the reads that did
           not see the client's own last write (must be 0) and fairness: the slowest client's
           calls against the fastest's.

  scripts/net_bench.py --build-dir build/bench latency --runs 3
  scripts/net_bench.py --build-dir build/bench load --clients 1,4,16,64 --seconds 5

The client is bench/net_bench.cpp (target zin_net_bench, built with -DZINMOX_BUILD_BENCHMARKS=ON).
"""
import argparse
import contextlib
import json
import os
import re
import subprocess
import sys
import tempfile
import threading
import time

ROOT = os.path.dirname(os.path.dirname(os.path.abspath(__file__)))

# One MOX core of 64 asynchronous outputs and inputs; input i loops back output i by default.
LOAD_CORE = {"devices": [{"index": 0, "chains": [{"number": 1, "cores": [
    {"index": 0, "type": 9, "major_version": 10, "minor_version": 2,
     "async_outputs": 64, "async_inputs": 64}]}]}]}


@contextlib.contextmanager
def server(zinmox, target=None):
    """Runs `zinmox serve` on a free loopback port; yields the port; always stops it."""
    command = [zinmox] + (["--target", target] if target else []) + [
        "serve", "--listen", "127.0.0.1:0"]
    process = subprocess.Popen(command, stdout=subprocess.PIPE, stderr=subprocess.STDOUT,
                               text=True)
    try:
        first = process.stdout.readline()
        match = re.search(r"127\.0\.0\.1:(\d+)", first)
        if not match:
            raise RuntimeError("zinmox serve did not start: " + first.strip())
        # Keep reading its log, so that the server never blocks on a full pipe.
        threading.Thread(target=process.stdout.read, daemon=True).start()
        yield int(match.group(1))
    finally:
        process.terminate()
        try:
            process.wait(timeout=10)
        except subprocess.TimeoutExpired:
            process.kill()
            process.wait()


def latency(args, zinmox, client):
    for run in range(args.runs):
        with server(zinmox) as port:
            result = subprocess.run([client, "latency", str(port), str(args.calls)],
                                    capture_output=True, text=True, timeout=600)
        if result.returncode != 0:
            sys.exit("latency client failed: " + result.stderr)
        print(f"run {run + 1} of {args.runs}:")
        print(result.stdout, end="", flush=True)


def load(args, zinmox, client):
    with tempfile.TemporaryDirectory() as tmp:
        description = os.path.join(tmp, "load-core.json")
        with open(description, "w") as out:
            json.dump(LOAD_CORE, out)
        print(f"{'clients':>7} {'calls/s':>10} {'mismatches':>10} {'fairness':>9}")
        for count in [int(n) for n in args.clients.split(",")]:
            if not 1 <= count <= 64:
                sys.exit("--clients: each count must be 1 to 64 (one output bit each)")
            with server(zinmox, description) as port:
                # Every client connects first, then all start at once.
                start_ms = int((time.time() + 2 + 0.05 * count) * 1000)
                clients = [subprocess.Popen([client, "load", str(port), str(bit),
                                             str(args.seconds), str(start_ms)],
                                            stdout=subprocess.PIPE, stderr=subprocess.PIPE,
                                            text=True) for bit in range(count)]
                results = []
                try:
                    for process in clients:
                        out, err = process.communicate(timeout=args.seconds + 120)
                        if process.returncode != 0:
                            raise RuntimeError("load client failed: " + err.strip())
                        results.append([int(x) for x in out.split()])
                finally:
                    for process in clients:
                        if process.poll() is None:
                            process.kill()
                            process.wait()
            calls = [r[0] for r in results]
            mismatches = sum(r[1] for r in results)
            fairness = min(calls) / max(calls) if max(calls) else 0.0
            print(f"{count:>7} {sum(calls) / args.seconds:>10.0f} {mismatches:>10} "
                  f"{fairness:>9.2f}", flush=True)


def main():
    parser = argparse.ArgumentParser(description=__doc__,
                                     formatter_class=argparse.RawDescriptionHelpFormatter)
    parser.add_argument("--build-dir", default=os.path.join(ROOT, "build", "bench"))
    sub = parser.add_subparsers(dest="mode", required=True)
    lat = sub.add_parser("latency", help="p50 and p99 of a ping and four calls")
    lat.add_argument("--runs", type=int, default=3)
    lat.add_argument("--calls", type=int, default=3000)
    ld = sub.add_parser("load", help="many client processes doing write-and-read pairs")
    ld.add_argument("--clients", default="1,4,16,64")
    ld.add_argument("--seconds", type=float, default=5.0)
    args = parser.parse_args()
    zinmox = os.path.join(args.build_dir, "bin", "zinmox")
    client = os.path.join(args.build_dir, "bin", "zin_net_bench")
    for path in (zinmox, client):
        if not os.access(path, os.X_OK):
            sys.exit(f"{path} is missing: configure with -DZINMOX_BUILD_BENCHMARKS=ON and build "
                     "the targets zinmox and zin_net_bench")
    (latency if args.mode == "latency" else load)(args, zinmox, client)


if __name__ == "__main__":
    main()
