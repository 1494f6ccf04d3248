#!/usr/bin/env bash
# Remakes the LZMA streams of xz (stand-alone format, size unknown, end
# marker) that decoders_test.cpp decodes, of the text that test builds.
set -euo pipefail
cd "$(dirname "$0")"
python3 -c 'for i in range(3000): print("line %d of the fixture, value %d" % (i, i * 7919 % 10007))' |
  xz --format=lzma -6 -c > text.xz.lzma
xz --format=lzma -c < /dev/null > empty.xz.lzma
