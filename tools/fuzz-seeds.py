#!/usr/bin/env python3
"""Makes the seed corpus of fuzz_open in OUT: every sample archive that
`cairn_tests --gtest_filter=Samples.DumpWhenAsked` wrote to DUMP (its
list.txt names them), and a small copy of each real game archive given: its
header, its first lumps that fit in 64 KiB, and a directory of just those
right after them, with the offsets fixed up.

    fuzz-seeds.py DUMP OUT [REAL.wad|REAL.pak ...]
"""
import os
import shutil
import struct
import sys

LIMIT = 65536


def shrink(data):
    """The archive cut down to its first lumps, still a WAD or a PACK."""
    wad = data[:4] in (b"IWAD", b"PWAD")
    if wad:
        count, at = struct.unpack_from("<II", data, 4)
        lumps = [struct.unpack_from("<II8s", data, at + 16 * i) for i in range(count)]
        lumps = [(n, o, s) for o, s, n in lumps]
    else:
        at, size = struct.unpack_from("<II", data, 4)
        lumps = [struct.unpack_from("<56sII", data, at + 64 * i) for i in range(size // 64)]
    record = 16 if wad else 64
    body, kept = bytearray(), []
    for name, offset, size in lumps:
        if 12 + len(body) + size + record * (len(kept) + 1) > LIMIT:
            continue
        kept.append((name, 12 + len(body), size))
        body += data[offset:offset + size]
        if len(kept) == 24:
            break
    where = 12 + len(body)
    if wad:
        head = data[:4] + struct.pack("<II", len(kept), where)
        table = b"".join(struct.pack("<II8s", o, s, n) for n, o, s in kept)
    else:
        head = b"PACK" + struct.pack("<II", where, 64 * len(kept))
        table = b"".join(struct.pack("<56sII", n, o, s) for n, o, s in kept)
    return head + body + table


def main():
    dump, out, reals = sys.argv[1], sys.argv[2], sys.argv[3:]
    os.makedirs(out, exist_ok=True)
    with open(os.path.join(dump, "list.txt"), encoding="latin-1") as f:
        for line in f:
            n, name = line.rstrip("\n").split(" ", 1)
            shutil.copyfile(os.path.join(dump, n, name), os.path.join(out, f"sample-{n}"))
    for real in reals:
        with open(real, "rb") as f:
            seed = shrink(f.read())
        with open(os.path.join(out, "real-" + os.path.basename(real)), "wb") as f:
            f.write(seed)
    print(f"{len(os.listdir(out))} seeds in {out}")


if __name__ == "__main__":
    main()
