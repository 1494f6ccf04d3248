#!/usr/bin/env python3
"""Makes the VCDIFF interop cases: seeded pairs of old and new files, and
their deltas as xdelta3 writes them.

  make_xdelta3_cases.py OUTDIR               cases and OUTDIR/manifest.txt
  make_xdelta3_cases.py --fuzz-seeds OUTDIR  small cases packed as fuzz inputs

Manifest lines (names relative to OUTDIR):
  decode SOURCE DELTA TARGET   the delta must rebuild TARGET exactly
  reject SOURCE DELTA TEXT     decoding must fail with the text TEXT
"""
import os
import random
import struct
import subprocess
import sys

KIB = 1024
MIB = 1024 * KIB


def edit(rng, data, count, max_run, kinds):
    """Applies count scattered edits (replace, insert, delete) of up to
    max_run bytes, built piecewise so that large files stay fast."""
    positions = sorted(rng.randrange(len(data) + 1) for _ in range(count))
    pieces, last = [], 0
    for pos in positions:
        if pos < last:
            continue
        pieces.append(data[last:pos])
        run = rng.randint(1, max_run)
        kind = rng.choice(kinds)
        if kind == "replace":
            pieces.append(rng.randbytes(run))
            last = min(len(data), pos + run)
        elif kind == "insert":
            pieces.append(rng.randbytes(run))
            last = pos
        else:
            last = min(len(data), pos + run)
    pieces.append(data[last:])
    return b"".join(pieces)


def moved_blocks(rng, data, block):
    blocks = [data[i:i + block] for i in range(0, len(data), block)]
    rng.shuffle(blocks)
    return b"".join(blocks)


def with_runs(rng, size):
    """Text with long runs of one byte and short repeated patterns, which
    xdelta3 encodes as RUN and as copies overlapping their own output."""
    out = bytearray()
    while len(out) < size:
        choice = rng.randrange(3)
        if choice == 0:
            out += bytes([rng.randrange(256)]) * rng.randint(8, 4000)
        elif choice == 1:
            out += rng.randbytes(rng.randint(1, 7)) * rng.randint(4, 500)
        else:
            out += rng.randbytes(rng.randint(1, 300))
    return bytes(out[:size])


def pairs(rng, unit):
    """(name, source, target, extra xdelta3 options) for every case; unit is
    1 KiB for the interop cases and a few bytes for fuzz seeds."""
    def count(n):
        return max(1, n * unit // KIB)

    base = rng.randbytes(256 * unit)
    other = rng.randbytes(200 * unit)
    several = rng.randbytes(2048 * unit)
    runs = with_runs(rng, 300 * unit)
    yield "empty", b"", b"", []
    yield "empty-source", b"", rng.randbytes(50 * unit), []
    yield "empty-target", base, b"", []
    yield "identical", base, base, []
    yield "unrelated", base, other, []
    yield "small-edits", base, edit(rng, base, count(300), 4, ["replace"]), []
    yield "inserts", base, edit(rng, base, count(60), 2 * unit, ["insert"]), []
    yield "deletes", base, edit(rng, base, count(60), 2 * unit, ["delete"]), []
    yield "moved-blocks", base, moved_blocks(rng, edit(rng, base, count(20), 50, ["replace"]), 8 * unit), []
    yield "runs", runs, edit(rng, runs, count(100), 100, ["replace", "insert", "delete"]), []
    # Windows of 16 KiB against source windows of 512 KiB: many windows,
    # each with its own segment somewhere inside the source.
    yield "several-windows", several, edit(rng, moved_blocks(rng, several, 64 * unit), count(200), 300,
                                           ["replace", "insert", "delete"]), ["-W", "16384", "-B", "524288"]


def xdelta3(options, source, target, delta):
    subprocess.run(["xdelta3", "-e", "-f", *options, "-s", source, target, delta], check=True)


def write(path, data):
    with open(path, "wb") as f:
        f.write(data)


def make_cases(outdir):
    rng = random.Random(20240611)
    os.makedirs(outdir, exist_ok=True)
    lines = []
    for name, source, target, options in pairs(rng, KIB):
        write(os.path.join(outdir, name + ".source"), source)
        write(os.path.join(outdir, name + ".target"), target)
        for suffix, extra in (("", []), (".n", ["-n"])):
            delta = name + suffix + ".vcdiff"
            xdelta3(["-A", "-S", "none", *extra, *options], os.path.join(outdir, name + ".source"),
                    os.path.join(outdir, name + ".target"), os.path.join(outdir, delta))
            lines.append(f"decode {name}.source {delta} {name}.target")

    # About 100 MiB with 5% scattered changes, with xdelta3's default
    # windows and with the largest window and source window we support.
    big = rng.randbytes(100 * MIB)
    write(os.path.join(outdir, "big.source"), big)
    write(os.path.join(outdir, "big.target"), edit(rng, big, 80000, 128, ["replace", "insert", "delete"]))
    for suffix, options in (("", []), (".wide", ["-W", "16777216", "-B", "1073741824"])):
        delta = "big" + suffix + ".vcdiff"
        xdelta3(["-A", "-S", "none", *options], os.path.join(outdir, "big.source"),
                os.path.join(outdir, "big.target"), os.path.join(outdir, delta))
        lines.append(f"decode big.source {delta} big.target")

    # xdelta3's default output uses a secondary compressor.
    xdelta3([], os.path.join(outdir, "small-edits.source"), os.path.join(outdir, "small-edits.target"),
            os.path.join(outdir, "small-edits.secondary.vcdiff"))
    lines.append("reject small-edits.source small-edits.secondary.vcdiff VcdiffDecoder->ReadHeader: "
                 "VcdiffDecoder does not handle delta stream using secondary compressors")

    write(os.path.join(outdir, "manifest.txt"), ("\n".join(lines) + "\n").encode())


def make_fuzz_seeds(outdir):
    """Fuzz inputs: a 2-byte little-endian source length, the source, then
    the delta."""
    rng = random.Random(7)
    os.makedirs(outdir, exist_ok=True)
    scratch = os.path.join(outdir, "scratch")
    os.makedirs(scratch, exist_ok=True)
    for name, source, target, options in pairs(rng, 8):
        for suffix, extra in (("", []), (".n", ["-n"])):
            write(os.path.join(scratch, "s"), source)
            write(os.path.join(scratch, "t"), target)
            xdelta3(["-A", "-S", "none", *extra, *options], os.path.join(scratch, "s"), os.path.join(scratch, "t"),
                    os.path.join(scratch, "d"))
            with open(os.path.join(scratch, "d"), "rb") as f:
                delta = f.read()
            write(os.path.join(outdir, name + suffix), struct.pack("<H", len(source)) + source + delta)
    for leftover in os.listdir(scratch):
        os.remove(os.path.join(scratch, leftover))
    os.rmdir(scratch)


if __name__ == "__main__":
    if len(sys.argv) == 3 and sys.argv[1] == "--fuzz-seeds":
        make_fuzz_seeds(sys.argv[2])
    elif len(sys.argv) == 2:
        make_cases(sys.argv[1])
    else:
        sys.exit(__doc__)
