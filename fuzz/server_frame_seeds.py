#!/usr/bin/env python3
"""Writes seed streams for server_frame_fuzzer into FOLDER (server_frame_seeds.py FOLDER).

Each file is what one client sends: both protocol versions, their requests, and the frames each
version refuses. Fold them into the corpus with
  build/fuzz/bin/server_frame_fuzzer -merge=1 fuzz/corpus/server_frame_fuzzer FOLDER"""
import os
import struct
import sys

READ = b"00 1 0 03 1 00000098 0\n00 1 0 04 1 00000004 0"
WRITE = b"00 1 0 01 0 000000A9 " + b"0" * 42 + b"\n00 1 0 02 0 00000004 0"


def frame(kind, body=b""):
    return struct.pack(">IB", len(body) + 1, kind) + body


def hello(version):
    return frame(0x01, b"ZNET" + struct.pack(">H", version))


def sequence(text, bits=0, kind=0x03):
    return frame(kind, struct.pack(">I", bits) + text)


REQUESTS = (sequence(READ, 160) + sequence(WRITE, kind=0x06) + sequence(READ, 160, 0x06) +
            frame(0x07) + frame(0x02, struct.pack(">5I", 0, 1, 0, 16, 128)) + frame(0x05) +
            frame(0x04))
CASES = {
    "v2-requests": hello(2) + REQUESTS,
    "v1-requests": hello(1) + REQUESTS,
    "v2-ping-with-body": hello(2) + frame(0x07, b"\x00") + frame(0x07),
    "v2-sequence-and-flush-bad": hello(2) + frame(0x06, b"\x00") +
    sequence(READ, 0xFFFFFFFF, 0x06) + sequence(b"zz", 0, 0x06),
    "v2-unknown-types": hello(2) + b"".join(frame(t) for t in range(0x08, 0x20)),
    "greeting-frame-too-long": struct.pack(">I", 65) + b"\x01" + bytes(64),
}

folder = sys.argv[1]
os.makedirs(folder, exist_ok=True)
for name, data in CASES.items():
    with open(os.path.join(folder, name), "wb") as out:
        out.write(data)
