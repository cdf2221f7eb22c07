#!/usr/bin/env python3
"""Floods a target server with maximal command sequences and reports its peak memory.

Starts `zinmox serve` on a core with four 65535-bit ports, lets CLIENTS hostile clients send
each pattern in a loop for a few seconds while another client reads a status word every 50 ms,
and prints per pattern the slowest hostile reply, the slowest status read and the server's
resident size (current and peak) from /proc.

    scripts/server_flood.py --zinmox build/default/bin/zinmox --clients 63
"""
import argparse
import json
import os
import socket
import struct
import subprocess
import tempfile
import threading
import time

MAX_FRAME = 4 << 20
WIDTH = 65535
WRITE_BITS = 2 * WIDTH + 17 * WIDTH + 1
READ_BITS = 4 * WIDTH + 6 * WIDTH + 16


def frame(kind, body=b""):
    return struct.pack(">I", 1 + len(body)) + bytes([kind]) + body


def sequence(read_bits, text):
    return frame(3, struct.pack(">I", read_bits) + text.encode())


def receive(sock):
    def exactly(n):
        data = b""
        while len(data) < n:
            chunk = sock.recv(n - len(data))
            if not chunk:
                raise EOFError("the server closed the connection")
            data += chunk
        return data

    body = exactly(struct.unpack(">I", exactly(4))[0])
    return body[0], body[1:]


def connect(port):
    sock = socket.create_connection(("127.0.0.1", port))
    sock.settimeout(120)
    sock.sendall(frame(1, b"ZNET" + struct.pack(">H", 1)))
    kind, _ = receive(sock)
    assert kind == 0x81, "no welcome"
    return sock


def repeated(line, room=MAX_FRAME - 5):
    return "\n".join([line] * ((room + 1) // (len(line) + 1)))


def patterns():
    write = "00 1 0 01 0 %08X %s" % (WRITE_BITS, "0" * ((WRITE_BITS + 2) // 4))
    read_line = "00 1 0 03 1 %08X 0" % READ_BITS
    reads = (1 << 20) // ((READ_BITS + 7) // 8)
    return {
        "short 01 lines": (0, repeated("00 1 0 01 0 %08X 0" % WRITE_BITS)),
        "02 lines": (0, repeated("00 1 0 02 0 00000004 0")),
        "write and commit pairs": (0, repeated(write + "\n00 1 0 02 0 00000004 0")),
        "1 MiB of reads": (reads * 8 * ((READ_BITS + 7) // 8), "\n".join([read_line] * reads)),
    }


def memory(pid):
    found = {}
    with open("/proc/%d/status" % pid) as status:
        for line in status:
            key, _, value = line.partition(":")
            if key in ("VmRSS", "VmHWM"):
                found[key] = int(value.split()[0]) // 1024
    return found


def flood(port, pid, clients, seconds, read_bits, text):
    request = sequence(read_bits, text)
    stop = threading.Event()
    slowest = [0.0]

    def hostile():
        sock = connect(port)
        while not stop.is_set():
            start = time.monotonic()
            sock.sendall(request)
            receive(sock)
            slowest[0] = max(slowest[0], time.monotonic() - start)

    threads = [threading.Thread(target=hostile) for _ in range(clients)]
    for thread in threads:
        thread.start()
    other = connect(port)
    worst = 0.0
    end = time.monotonic() + seconds
    while time.monotonic() < end:
        start = time.monotonic()
        other.sendall(frame(2, struct.pack(">5I", 0, 1, 0, 16, 128)))
        receive(other)
        worst = max(worst, time.monotonic() - start)
        time.sleep(0.05)
    stop.set()
    for thread in threads:
        thread.join()
    return slowest[0], worst, memory(pid)


def main():
    parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    parser.add_argument("--zinmox", default="build/default/bin/zinmox")
    parser.add_argument("--clients", type=int, default=1)
    parser.add_argument("--seconds", type=float, default=6)
    parser.add_argument("--port", type=int, default=7790)
    args = parser.parse_args()
    core = {"index": 0, "major_version": 10, "async_inputs": WIDTH, "sync_inputs": WIDTH,
            "async_outputs": WIDTH, "sync_outputs": WIDTH}
    description = {"devices": [{"index": 0, "chains": [{"number": 1, "cores": [core]}]}]}
    with tempfile.TemporaryDirectory() as folder:
        path = os.path.join(folder, "big.json")
        with open(path, "w") as file:
            json.dump(description, file)
        server = subprocess.Popen(
            [args.zinmox, "--target", path, "serve", "--listen", "127.0.0.1:%d" % args.port],
            stdout=subprocess.DEVNULL)
        try:
            time.sleep(1)
            for name, (read_bits, text) in patterns().items():
                slowest, worst, mem = flood(args.port, server.pid, args.clients, args.seconds,
                                            read_bits, text)
                print("%-24s hostile reply %6.2f s, status read %5.2f s, RSS %4d MB, peak %4d MB"
                      % (name, slowest, worst, mem["VmRSS"], mem["VmHWM"]))
        finally:
            server.terminate()
            server.wait()


if __name__ == "__main__":
    main()
