#!/usr/bin/env python3
"""Writes hand-made game packages, good and hostile, for the service tests.

usage: craft_package.py KIND OUT
"""
import os
import random
import struct
import sys
import zipfile


def random_bytes(n, seed=7):
    return random.Random(seed).randbytes(n)


def write(out, entries, compression=zipfile.ZIP_DEFLATED):
    """entries: (name, data or None for a folder, unix mode or None)"""
    with zipfile.ZipFile(out, "w", compression) as z:
        for name, data, mode in entries:
            info = zipfile.ZipInfo(name, date_time=(2020, 1, 2, 3, 4, 6))
            info.compress_type = compression
            if mode is not None:
                info.create_system = 3
                info.external_attr = mode << 16
            elif name.endswith("/"):
                info.external_attr = 0o40755 << 16 | 0x10
            z.writestr(info, b"" if data is None else data)


def game(extra=(), name="Game"):
    return [(name + "/", None, None), (name + "/" + name + ".exe", b"MZ game", None)] + list(extra)


def patch_sizes(out, member, new_size):
    """Rewrites the uncompressed size of one member in its local header and the central directory."""
    data = bytearray(open(out, "rb").read())
    encoded = member.encode()
    for signature, offset in ((b"PK\x03\x04", 22), (b"PK\x01\x02", 24)):
        pos = 0
        while True:
            pos = data.find(signature, pos)
            if pos < 0:
                break
            name_at = pos + (30 if signature == b"PK\x03\x04" else 46)
            if data[name_at:name_at + len(encoded)] == encoded:
                struct.pack_into("<I", data, pos + offset, new_size)
            pos += 4
    open(out, "wb").write(data)


def huge_declared(out):
    """One stored member whose zip64 sizes claim about a petabyte."""
    name = b"Game/Game.exe"
    payload = b"MZ"
    crc = zipfile.crc32(payload) if hasattr(zipfile, "crc32") else __import__("zlib").crc32(payload)
    huge = 1 << 50
    extra_local = struct.pack("<HHQQ", 1, 16, huge, len(payload))
    local = struct.pack("<IHHHHHIIIHH", 0x04034B50, 45, 0, 0, 0, 0, crc, 0xFFFFFFFF, 0xFFFFFFFF,
                        len(name), len(extra_local)) + name + extra_local + payload
    extra_central = struct.pack("<HHQQ", 1, 16, huge, len(payload))
    central = struct.pack("<IHHHHHHIIIHHHHHII", 0x02014B50, 45, 45, 0, 0, 0, 0, crc, 0xFFFFFFFF, 0xFFFFFFFF,
                          len(name), len(extra_central), 0, 0, 0, 0, 0) + name + extra_central
    end = struct.pack("<IHHHHIIH", 0x06054B50, 0, 0, 1, 1, len(central), len(local), 0)
    open(out, "wb").write(local + central + end)


def main():
    kind, out = sys.argv[1], sys.argv[2]
    if kind == "good":
        write(out, game([("Game/Game.bvxinf", b"<Name>Game", None), ("Game/data/level1.dat", random_bytes(5000), None)]))
    elif kind == "absolute":
        write(out, game([("/tmp/evil.exe", b"x", None)]))
    elif kind == "drive":
        write(out, game([("C:/evil.exe", b"x", None)]))
    elif kind == "dotdot":
        write(out, game([("Game/../evil.exe", b"x", None)]))
    elif kind == "backslash":
        write(out, game([("Game/..\\..\\evil.exe", b"x", None)]))
    elif kind == "symlink":
        write(out, game([("Game/link", b"/etc/passwd", 0o120777)]))
    elif kind == "fifo":
        write(out, game([("Game/pipe", b"", 0o010644)]))
    elif kind == "device":
        write(out, game([("Game/dev", b"", 0o020644)]))
    elif kind == "twotop":
        write(out, game() + [("Other/Other.exe", b"MZ", None)])
    elif kind == "rootfile":
        write(out, game() + [("readme.txt", b"hello", None)])
    elif kind == "nogame":
        write(out, [("Game/", None, None), ("Game/readme.txt", b"hello", None)])
    elif kind == "reserved":
        write(out, game(name="Icons"))
    elif kind == "big":
        write(out, game([("Game/big.dat", random_bytes(3 * 1024 * 1024), None)]), zipfile.ZIP_STORED)
    elif kind == "ratio":
        write(out, game([("Game/zeros.dat", bytes(64 * 1024 * 1024), None)]))
    elif kind == "huge":
        huge_declared(out)
    elif kind == "notzip":
        open(out, "wb").write(random_bytes(4096))
    elif kind == "empty":
        open(out, "wb").write(b"")
    elif kind in ("truncated", "corrupt", "liar"):
        write(out, game([("Game/data.bin", random_bytes(400000), None), ("Game/tail.dat", b"t" * 100, None)]))
        data = bytearray(open(out, "rb").read())
        if kind == "truncated":
            open(out, "wb").write(data[: len(data) // 2])
        elif kind == "corrupt":
            middle = data.find(b"Game/data.bin") + 200000
            for i in range(middle, middle + 64):
                data[i] ^= 0x5A
            open(out, "wb").write(data)
        else:
            patch_sizes(out, "Game/data.bin", 1000)
    else:
        sys.exit("unknown kind " + kind)


if __name__ == "__main__":
    main()
