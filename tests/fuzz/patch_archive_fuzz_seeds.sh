#!/usr/bin/env bash
# Writes small patch archives as seeds: members made by xz and by Python's
# lzma (one with the unpacked size filled in), an empty member, and two
# members back to back. Dictionaries are small: the fuzz target skips
# streams that would allocate more than 1 MiB.
set -euo pipefail
out=$1
mkdir -p "$out"
python3 - "$out" <<'PY'
import lzma, os, struct, subprocess, sys
out = sys.argv[1]
text = b"".join(b"line %d of a patched file\n" % i for i in range(40))
def member(name, data):
    return bytes([len(name)]) + name + struct.pack("<Q", len(data))[:5] + data
xz = subprocess.run(["xz", "--format=lzma", "--lzma1=preset=6,dict=64KiB", "-c"], input=text,
                    capture_output=True, check=True).stdout
small = [{"id": lzma.FILTER_LZMA1, "dict_size": 1 << 16}]
alone = lzma.compress(text, format=lzma.FORMAT_ALONE, filters=small)
sized = alone[:5] + struct.pack("<Q", len(text)) + alone[13:]
seeds = {
    "xz.pak": member(b"data\\xz.txt", xz),
    "python.pak": member(b"python.txt", alone),
    "sized.pak": member(b"sized.txt", sized),
    "empty.pak": member(b"empty", lzma.compress(b"", format=lzma.FORMAT_ALONE, filters=small)),
    "two.pak": member(b"a", alone) + member(b"b", xz),
}
for name, data in seeds.items():
    with open(os.path.join(out, name), "wb") as f:
        f.write(data)
PY
