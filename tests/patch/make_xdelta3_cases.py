#!/usr/bin/env python3
"""Seeded files and their xdelta3 deltas (no secondary compressor; with and
without window checksums). OUTDIR: the files and manifest.txt (lines SOURCE
DELTA TARGET); --fuzz-seeds OUTDIR: small ones as fuzz inputs (2-byte source
length, little-endian, the source, the delta)."""
import itertools
import random
import struct
import subprocess
import sys
from pathlib import Path

EDITS = ["replace", "insert", "delete"]


def edit(rng, data, count, max_run, kinds):
    """count scattered edits of up to max_run bytes, built piecewise for speed."""
    pieces, last = [], 0
    for pos in sorted(rng.randrange(len(data) + 1) for _ in range(count)):
        if pos < last:
            continue
        pieces.append(data[last:pos])
        run = rng.randint(1, max_run)
        kind = rng.choice(kinds)
        if kind != "delete":
            pieces.append(rng.randbytes(run))
        last = pos if kind == "insert" else min(len(data), pos + run)
    return b"".join(pieces + [data[last:]])


def pairs(rng, unit):
    """(name, source, target, options); unit: 1 KiB for interop, 8 for fuzzing."""
    base, several = rng.randbytes(256 * unit), rng.randbytes(2048 * unit)
    # Runs of one byte and short repeated patterns, which xdelta3 encodes as
    # RUN and as copies that overlap their own output.
    runs = b"".join(bytes([rng.randrange(256)]) * rng.randint(8, 4000) + rng.randbytes(rng.randint(1, 7)) *
                    rng.randint(4, 500) + rng.randbytes(rng.randint(1, 300)) for _ in range(unit // 8 + 1))
    blocks = [several[i:i + 64 * unit] for i in range(0, len(several), 64 * unit)]
    yield "empty", b"", b"", []
    yield "empty-source", b"", rng.randbytes(50 * unit), []
    yield "edits", base, edit(rng, base, 300 * unit // 1024 + 1, 2 * unit, EDITS), []
    yield "runs", runs, edit(rng, runs, 100 * unit // 1024 + 1, 100, EDITS), []
    # Moved blocks in windows of 16 KiB against source windows of 512 KiB:
    # many windows, each with its own segment somewhere inside the source.
    yield "several-windows", several, edit(rng, b"".join(rng.sample(blocks, len(blocks))), 200, 300, EDITS), [
        "-W", "16384", "-B", "524288"]


def xdelta3(options, source, target, delta):
    subprocess.run(["xdelta3", "-e", "-f", "-A", "-S", "none", *options, "-s", source, target, delta], check=True)


def make_cases(outdir):
    rng = random.Random(20240611)
    outdir.mkdir(parents=True, exist_ok=True)
    # And about 100 MiB with 5% scattered changes, in the largest windows
    # and source window we support.
    big = rng.randbytes(100 << 20)
    cases = [*pairs(rng, 1024), ("big", big, edit(rng, big, 80000, 128, EDITS), ["-W", "16777216", "-B", "1073741824"])]
    lines = ""
    for name, source, target, options in cases:
        (outdir / f"{name}.source").write_bytes(source)
        (outdir / f"{name}.target").write_bytes(target)
        for delta, checksums in ((f"{name}.vcdiff", []), (f"{name}.n.vcdiff", ["-n"])):
            xdelta3(checksums + options, outdir / f"{name}.source", outdir / f"{name}.target", outdir / delta)
            lines += f"{name}.source {delta} {name}.target\n"
    (outdir / "manifest.txt").write_text(lines)


def make_fuzz_seeds(outdir):
    outdir.mkdir(parents=True, exist_ok=True)
    s, t, d = (outdir / name for name in ("s", "t", "d"))
    for (name, source, target, options), (suffix, checksums) in itertools.product(
            pairs(random.Random(7), 8), (("", []), (".n", ["-n"]))):
        s.write_bytes(source)
        t.write_bytes(target)
        xdelta3(checksums + options, s, t, d)
        (outdir / (name + suffix)).write_bytes(struct.pack("<H", len(source)) + source + d.read_bytes())
    for scratch in (s, t, d):
        scratch.unlink()


if __name__ == "__main__":
    if len(sys.argv) == 3 and sys.argv[1] == "--fuzz-seeds":
        make_fuzz_seeds(Path(sys.argv[2]))
    elif len(sys.argv) == 2:
        make_cases(Path(sys.argv[1]))
    else:
        sys.exit(__doc__)
