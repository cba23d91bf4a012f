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

ARCHIVES = {
    "/usr/share/games/doom/freedoom1.wad": "freedoom",
    "/usr/share/games/doom/freedoom2.wad": "freedoom",
    "/usr/share/games/doom/freedm.wad": "freedm",
    "/usr/share/games/quake/quakespasm.pak": "quakespasm",
}
SKIPPED = 77


def directory(data):
    """(name, offset, size) of each lump: a WAD's 16-byte records after its
    count and directory offset, or a PACK's 64-byte records after its
    directory offset and size."""
    magic = data[:4]
    if magic in (b"IWAD", b"PWAD"):
        count, at = struct.unpack_from("<II", data, 4)
        records = [struct.unpack_from("<II8s", data, at + 16 * i) for i in range(count)]
        return [(n.split(b"\0")[0].decode("latin-1"), o, s) for o, s, n in records]
    assert magic == b"PACK", magic
    at, size = struct.unpack_from("<II", data, 4)
    records = [struct.unpack_from("<56sII", data, at + 64 * i) for i in range(size // 64)]
    return [(n.split(b"\0")[0].decode("latin-1").replace("/", "\\"), o, s) for n, o, s in records]


def host_listing(host, plugin, archive, out):
    """The plug-in's entries as a file manager walks them: (name, packed, unpacked, result)."""
    text = subprocess.run([host, plugin, out, archive], check=True, capture_output=True,
                          text=True, encoding="latin-1").stdout.splitlines()
    assert text[1] == "archive 0 open 0", text[:2]
    entries, name = [], None
    for line in text[2:]:
        if line.startswith("entry "):
            name, packed, unpacked, _ = line[6:].rsplit(" ", 3)
            entry = [name, int(packed), int(unpacked)]
        elif line.startswith("result "):
            entries.append((*entry, int(line.split()[1])))
    return entries


def tool_listing(cairn, archive):
    """The rows of `cairn list`: (name, unpacked, packed)."""
    out = subprocess.run([cairn, "list", archive], check=True, capture_output=True, text=True,
                         encoding="latin-1").stdout.splitlines()
    rules = [i for i, line in enumerate(out) if line.startswith("--------")]
    return [(r[20:], int(r[:8]), int(r[10:18])) for r in out[rules[0] + 1:rules[1]]]


def check(archive, host, plugin, cairn, work):
    with open(archive, "rb") as f:
        data = f.read()
    lumps = directory(data)
    out = os.path.join(work, os.path.basename(archive))
    listed = host_listing(host, plugin, archive, out)
    stored = [i for i, e in enumerate(listed) if not e[0].startswith("_TO_")]
    assert [(n, s, s) for n, _, s in lumps] == [listed[i][:3] for i in stored], "plug-in listing"
    assert [(n, u, p) for n, p, u, _ in listed] == tool_listing(cairn, archive), "cairn list"
    failed = [e[0] for e in listed if e[3] != 0]
    assert not failed, f"extraction failed: {failed[:5]}"
    for i, (name, offset, size) in zip(stored, lumps):
        with open(os.path.join(out, "0", str(i)), "rb") as f:
            assert f.read() == data[offset:offset + size], f"bytes of {name}"
    pictures = [i for i, e in enumerate(listed) if e[0] == "_TO_TGA_\\gfx\\conback.lmp.tga"]
    if archive.endswith(".pak"):
        assert pictures, "no TGA copy of gfx\\conback.lmp"
        if shutil.which("identify"):
            tga = os.path.join(out, "0", str(pictures[0]))
            size = subprocess.run(["identify", "-format", "%w x %h", "tga:" + tga], check=True,
                                  capture_output=True, text=True).stdout
            assert size == "640 x 512", size
        else:
            print("  ImageMagick is not installed: the picture is not decoded")
    print(f"{archive}: {len(lumps)} lumps, {len(listed)} entries: listings and bytes agree")


def main():
    host, plugin, cairn = sys.argv[1:4]
    present = [a for a in ARCHIVES if os.path.isfile(a)]
    for a in ARCHIVES:
        if a not in present:
            print(f"skipped {a}: the package {ARCHIVES[a]} is not installed")
    if not present:
        return SKIPPED
    with tempfile.TemporaryDirectory() as work:
        for a in present:
            check(a, host, plugin, cairn, work)
    return 0


if __name__ == "__main__":
    sys.exit(main())
