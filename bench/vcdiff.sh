#!/usr/bin/env bash
# Decoding speed and memory against xdelta3 on one input, measured in the
# same run: a 256 MiB source, a target with ~5% scattered changes, and the
# delta by xdelta3 -e -A -S none. Prints both medians, the ratio (ours /
# xdelta3's; at most 1.0 is the goal) and both peak resident sizes.
#   bench/vcdiff.sh ROOT BUILD_DIR      (ROUNDS=N, default 7)
set -euo pipefail
root=$1
build=$2
rounds=${ROUNDS:-7}
tool=$build/tools/ironvale-patch
work=$build/bench-vcdiff
mkdir -p "$work"
cd "$work"

if [ ! -f delta ]; then
  echo "making the 256 MiB pair and its delta (once per build folder)"
  python3 - "$root/tests/patch" <<'PY'
import random, sys
sys.path.insert(0, sys.argv[1])
from make_xdelta3_cases import edit
rng = random.Random(256)
source = b"".join(rng.randbytes(16 << 20) for _ in range(16))
# About 200,000 edits of 1-128 bytes: some 5% of the file changes.
target = edit(rng, source, 200000, 128)
open("source", "wb").write(source)
open("target", "wb").write(target)
PY
  xdelta3 -e -f -A -S none -s source target delta
fi
ls -l source target delta | awk '{print "  " $5 "\t" $9}'

measure() {  # NAME COMMAND...: appends "seconds kilobytes" to NAME.times
  local name=$1
  shift
  rm -f "out.$name"
  /usr/bin/time -f "%e %M" -o "time.$name" "$@"
  cat "time.$name" >>"$name.times"
}

rm -f ours.times xdelta3.times
for ((i = 0; i < rounds; i++)); do
  # Alternate the order so neither tool always finds the caches warmer.
  if ((i % 2 == 0)); then
    measure ours "$tool" decode source delta out.ours
    measure xdelta3 xdelta3 -d -f -s source delta out.xdelta3
  else
    measure xdelta3 xdelta3 -d -f -s source delta out.xdelta3
    measure ours "$tool" decode source delta out.ours
  fi
done
cmp out.ours target
cmp out.xdelta3 target
rm -f out.ours out.xdelta3

median() { sort -n | awk '{v[NR] = $1} END {print (NR % 2) ? v[(NR + 1) / 2] : (v[NR / 2] + v[NR / 2 + 1]) / 2}'; }
ours=$(cut -d' ' -f1 ours.times | median)
theirs=$(cut -d' ' -f1 xdelta3.times | median)
ours_kb=$(cut -d' ' -f2 ours.times | sort -n | tail -1)
theirs_kb=$(cut -d' ' -f2 xdelta3.times | sort -n | tail -1)
echo "rounds:                $rounds"
echo "ironvale-patch decode: median ${ours} s, peak RSS $((ours_kb / 1024)) MiB"
echo "xdelta3 -d -s:         median ${theirs} s, peak RSS $((theirs_kb / 1024)) MiB"
awk -v a="$ours" -v b="$theirs" 'BEGIN {printf "ratio (ours / xdelta3): %.2f\n", a / b}'
