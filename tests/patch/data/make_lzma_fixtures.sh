#!/usr/bin/env bash
# Remakes the LZMA streams that the interop tests decode, with the peer
# tools themselves: xz (stand-alone format, size unknown, end marker) and
# Python's lzma module (FORMAT_ALONE, default and unusual lc/lp/pb).
# The text is FixtureText() of lzma_interop_test.cpp.
set -euo pipefail
cd "$(dirname "$0")"
text() { python3 -c '
import sys
for i in range(3000):
    sys.stdout.write("line %d of the fixture, value %d\n" % (i, i * 7919 % 10007))
'; }
text | xz --format=lzma -6 -c > text.xz.lzma
xz --format=lzma -c < /dev/null > empty.xz.lzma
text | python3 -c '
import lzma, sys
data = sys.stdin.buffer.read()
open("text.python.lzma", "wb").write(lzma.compress(data, format=lzma.FORMAT_ALONE))
filters = [{"id": lzma.FILTER_LZMA1, "dict_size": 1 << 16, "lc": 0, "lp": 2, "pb": 0}]
open("text.python-lc0lp2pb0.lzma", "wb").write(lzma.compress(data, format=lzma.FORMAT_ALONE, filters=filters))
open("empty.python.lzma", "wb").write(lzma.compress(b"", format=lzma.FORMAT_ALONE))
'
