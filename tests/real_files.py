#!/usr/bin/env python3
"""Real game archives that no one here wrote, from Debian's freedoom, freedm and
quakespasm packages: the plug-in's listing and the tool's listing must match a
reading of each directory done here, and every stored entry must extract to
exactly its bytes. The TGA copy of the Quake console background must decode
to a 640 x 512 picture. Archives whose package is not installed are skipped.

    real_files.py WCX_HOST PLUGIN CAIRN
"""
import os
import shutil
import struct
import subprocess
import sys
import tempfile

ARCHIVES = ["/usr/share/games/doom/freedoom1.wad", "/usr/share/games/doom/freedoom2.wad",
            "/usr/share/games/doom/freedm.wad", "/usr/share/games/quake/quakespasm.pak"]
CONBACK = "_TO_TGA_\\gfx\\conback.lmp.tga"


def directory(data):
    """(name, offset, size) of each lump: a WAD's 16-byte records after its
    count and directory offset, or a PACK's 64-byte records after its
    directory offset and size."""
    if data[:4] in (b"IWAD", b"PWAD"):
        count, at = struct.unpack_from("<II", data, 4)
        records = [struct.unpack_from("<II8s", data, at + 16 * i) for i in range(count)]
        records = [(n, o, s) for o, s, n in records]
    else:
        at, size = struct.unpack_from("<II", data, 4)
        records = [struct.unpack_from("<56sII", data, at + 64 * i) for i in range(size // 64)]
    return [(n.split(b"\0")[0].decode("latin-1").replace("/", "\\"), o, s) for n, o, s in records]


def run(*args):
    return subprocess.run(args, check=True, capture_output=True, text=True,
                          encoding="latin-1").stdout.splitlines()


def check(archive, host, plugin, cairn, out):
    with open(archive, "rb") as f:
        data = f.read()
    lumps = directory(data)
    # The host prints "entry NAME PACK UNP TIME" and then "result R ..." per entry.
    text = run(host, plugin, out, archive)
    assert text[1] == "archive 0 open 0", text[:2]
    names = [line[6:].rsplit(" ", 3) for line in text if line.startswith("entry ")]
    results = [line.split()[1] for line in text if line.startswith("result ")]
    listed = [(n, int(u), int(p)) for n, p, u, _ in names]
    assert results == ["0"] * len(listed), "extraction failed"
    stored = [i for i, e in enumerate(listed) if not e[0].startswith("_TO_")]
    assert [(n, s, s) for n, _, s in lumps] == [listed[i] for i in stored], "plug-in listing"
    rows = run(cairn, "list", archive)
    rules = [i for i, line in enumerate(rows) if line.startswith("--------")]
    shown = [(n.replace("\\", "/"), u, p) for n, u, p in listed]  # the tool shows '/'
    assert shown == [(r[20:], int(r[:8]), int(r[10:18])) for r in rows[rules[0] + 1:rules[1]]]
    for i, (name, offset, size) in zip(stored, lumps):
        with open(os.path.join(out, "0", str(i)), "rb") as f:
            assert f.read() == data[offset:offset + size], f"bytes of {name}"
    if archive.endswith(".pak"):
        tga = os.path.join(out, "0", str([e[0] for e in listed].index(CONBACK)))
        if shutil.which("identify"):
            assert run("identify", "-format", "%w x %h", "tga:" + tga) == ["640 x 512"]
    print(f"{archive}: {len(lumps)} lumps, {len(listed)} entries: listings and bytes agree")


def main():
    present = [a for a in ARCHIVES if os.path.isfile(a)]
    for a in sorted(set(ARCHIVES) - set(present)):
        print(f"skipped {a}: its package is not installed")
    with tempfile.TemporaryDirectory() as work:
        for a in present:
            check(a, *sys.argv[1:4], os.path.join(work, os.path.basename(a)))
    return 0 if present else 77


if __name__ == "__main__":
    sys.exit(main())
