#!/usr/bin/env python3
"""Seeded files and their xdelta3 deltas (no secondary compressor; with and without window checksums). OUTDIR: the
files and manifest.txt (lines SOURCE DELTA TARGET); --fuzz-seeds OUTDIR: small ones as fuzz inputs (2-byte source
length, little-endian, the source, the delta)."""
import random
import struct
import subprocess
import sys
from pathlib import Path


def edit(rng, data, count, max_run):
    """count scattered replacements, insertions and deletions of up to max_run bytes, built piecewise for speed."""
    pieces, last = [], 0
    for pos in sorted(rng.randrange(len(data) + 1) for _ in range(count)):
        if pos < last:
            continue
        run, kind = rng.randint(1, max_run), rng.choice(["replace", "insert", "delete"])
        pieces += [data[last:pos], b"" if kind == "delete" else rng.randbytes(run)]
        last = pos if kind == "insert" else min(len(data), pos + run)
    return b"".join(pieces + [data[last:]])


def pairs(rng, unit):
    """(name, source, target, options); unit: 1 KiB for interop, 8 for fuzzing."""
    base, several = rng.randbytes(256 * unit), rng.randbytes(2048 * unit)
    # Runs of one byte and short repeated patterns, which xdelta3 encodes as RUN and as copies that overlap their own
    # output.
    runs = b"".join(bytes([rng.randrange(256)]) * rng.randint(8, 4000) + rng.randbytes(rng.randint(1, 7)) *
                    rng.randint(4, 500) + rng.randbytes(rng.randint(1, 300)) for _ in range(unit // 8 + 1))
    blocks = [several[i:i + 64 * unit] for i in range(0, len(several), 64 * unit)]
    yield "empty", b"", b"", []
    yield "empty-source", b"", rng.randbytes(50 * unit), []
    yield "edits", base, edit(rng, base, 300 * unit // 1024 + 1, 2 * unit), []
    yield "runs", runs, edit(rng, runs, 100 * unit // 1024 + 1, 100), []
    # Moved blocks in windows of 16 KiB against source windows of 512 KiB: many windows, each with its own segment
    # somewhere inside the source.
    yield "several-windows", several, edit(rng, b"".join(rng.sample(blocks, len(blocks))), 200, 300), [
        "-W", "16384", "-B", "524288"]


def encode(outdir, cases):
    """Writes each case's files and its two deltas; yields (name, source, delta, target) per delta."""
    outdir.mkdir(parents=True, exist_ok=True)
    for name, source, target, options in cases:
        paths = [outdir / f"{name}.source", outdir / f"{name}.target"]
        paths[0].write_bytes(source)
        paths[1].write_bytes(target)
        for suffix, checksums in (("", []), (".n", ["-n"])):
            delta = outdir / f"{name}{suffix}.vcdiff"
            subprocess.run(["xdelta3", "-e", "-f", "-A", "-S", "none", *checksums, *options, "-s", *paths, delta],
                           check=True)
            yield name + suffix, paths[0], delta, paths[1]


if __name__ == "__main__" and sys.argv[1:2] == ["--fuzz-seeds"] and len(sys.argv) == 3:
    out = Path(sys.argv[2])
    for name, source, delta, _ in list(encode(out, pairs(random.Random(7), 8))):
        (out / name).write_bytes(struct.pack("<H", source.stat().st_size) + source.read_bytes() + delta.read_bytes())
    for scratch in [*out.glob("*.source"), *out.glob("*.target"), *out.glob("*.vcdiff")]:
        scratch.unlink()
elif __name__ == "__main__" and len(sys.argv) == 2:
    # And about 100 MiB with 5% scattered changes, in the largest windows and source window we support.
    rng = random.Random(20240611)
    big = rng.randbytes(100 << 20)
    cases = [*pairs(rng, 1024), ("big", big, edit(rng, big, 80000, 128), ["-W", "16777216", "-B", "1073741824"])]
    lines = [f"{s.name} {d.name} {t.name}\n" for _, s, d, t in encode(Path(sys.argv[1]), cases)]
    (Path(sys.argv[1]) / "manifest.txt").write_text("".join(lines))
elif __name__ == "__main__":
    sys.exit(__doc__)
