#!/usr/bin/env python3
"""Writes the byte files of the server's fuzz corpus (run from this folder).

Each file is what one client sends from connect to the end of its stream. The test
Robustness.UntrustedBytesAreAnsweredRefusedOrClosedAtTheirLimits sends each file, and mutations
of them, and checks that the server answers or closes, and keeps serving."""
import struct

READ = b"00 1 0 03 1 00000098 0\n00 1 0 04 1 00000004 0"
WRITE = b"00 1 0 01 0 000000A9 " + b"0" * 42 + b"\n00 1 0 02 0 00000004 0"


def frame(kind, body=b""):
    return struct.pack(">IB", len(body) + 1, kind) + body


def hello(version=1, magic=b"ZNET"):
    return frame(0x01, magic + struct.pack(">H", version))


def status(dev=0, chain=1, core=0, nbytes=16, nbits=128):
    return frame(0x02, struct.pack(">5I", dev, chain, core, nbytes, nbits))


def sequence(text, bits=0):
    return frame(0x03, struct.pack(">I", bits) + text)


CASES = {
    "empty": b"",
    "one-byte": b"\x00",
    "zero-length-frame": struct.pack(">I", 0),
    "oversized-length": struct.pack(">I", 0xFFFFFFFF) + b"\x01ZNET",
    "truncated-prefix": b"\x00\x00",
    "truncated-hello": hello()[:7],
    "hello-bad-magic": hello(magic=b"ZNEX"),
    "hello-version-0": hello(version=0),
    "hello-version-65535": hello(version=65535),
    "hello-short": frame(0x01, b"ZNET"),
    "hello-long": frame(0x01, b"ZNET\x00\x01extra"),
    "request-before-hello": status(),
    "reply-type-from-client": hello() + frame(0x81, b"ZNET\x00\x01"),
    "hello-twice": hello() + hello(),
    "unknown-type": hello() + frame(0x42, b"\x00" * 8),
    "status-short": hello() + frame(0x02, b"\x00\x00\x00\x01"),
    "status-long": hello() + frame(0x02, b"\x00" * 24),
    "status-huge-bytes": hello() + status(nbytes=0xFFFFFFFF, nbits=0xFFFFFFFF),
    "status-bits-beyond-bytes": hello() + status(nbytes=2, nbits=1000),
    "status-nowhere": hello() + status(dev=255, chain=15, core=15),
    "status-big-ref": hello() + status(dev=0xFFFFFFFF, chain=0xFFFFFFFF, core=0xFFFFFFFF),
    "sequence-no-count": hello() + frame(0x03, b"\x00\x00"),
    "sequence-empty-text": hello() + sequence(b""),
    "sequence-huge-read": hello() + sequence(READ, 0xFFFFFFFF),
    "sequence-read-too-small": hello() + sequence(READ, 8),
    "sequence-binary-text": hello() + sequence(bytes(range(256)), 64),
    "sequence-nul-in-text": hello() + sequence(READ.replace(b" ", b"\x00", 1), 160),
    "sequence-valid-read": hello() + sequence(READ, 160),
    "sequence-valid-write-flush": hello() + sequence(WRITE) + frame(0x04),
    "sequence-truncated": hello() + sequence(READ, 160)[:20],
    "flush-with-body": hello() + frame(0x04, b"\x01"),
    "list-with-body": hello() + frame(0x05, b"\x00\x00"),
    "list-valid": hello() + frame(0x05),
    "many-small-frames": hello() + frame(0x04) * 200 + status() * 50,
    "garbage-after-valid": hello() + frame(0x05) + b"\xde\xad\xbe\xef" * 8,
    "length-just-over-limit": hello() + struct.pack(">I", (1 << 16) + 1) + b"\x03",
}

for name, data in CASES.items():
    with open(name + ".bin", "wb") as out:
        out.write(data)
