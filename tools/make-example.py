#!/usr/bin/env python3
"""Writes examples/demo.wad: a small "PWAD" lump archive with three text lumps.

Layout: "PWAD", the lump count (u32) and the directory position (u32); the
lumps one after another; then the directory, 16 bytes per lump: offset (u32),
size (u32) and the name in 8 bytes, padded with zeros. All numbers are
little-endian.
"""
import pathlib
import struct

LUMPS = [
    (b"README", b"This is a demonstration archive for cairn.\n"),
    (b"CREDITS", b"Made by tools/make-example.py.\n"),
    (b"E1M1", b"Level one: a small room with a door.\n"),
]


def build(lumps):
    data = bytearray()
    directory = bytearray()
    position = 12
    for name, body in lumps:
        directory += struct.pack("<II8s", position, len(body), name)
        data += body
        position += len(body)
    header = b"PWAD" + struct.pack("<II", len(lumps), 12 + len(data))
    return header + bytes(data) + bytes(directory)


def main():
    out = pathlib.Path(__file__).resolve().parent.parent / "examples" / "demo.wad"
    out.parent.mkdir(parents=True, exist_ok=True)
    archive = build(LUMPS)
    assert len(archive) >= 104, "an archive is at least 104 bytes long"
    out.write_bytes(archive)
    print(f"wrote {out} ({len(archive)} bytes)")


if __name__ == "__main__":
    main()
