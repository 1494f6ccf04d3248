#!/usr/bin/env bash
# Benchmarks against peer tools, measured in the same run. Not part of the
# test suite: machines here are noisy, so only ratios are printed.
#   scripts/bench.sh NAME   runs bench/NAME.sh (e.g. vcdiff, lzma, download)
#   scripts/bench.sh        lists them
set -euo pipefail
root=$(cd "$(dirname "$0")/.." && pwd)
if [ $# -eq 0 ]; then
  echo "usage: scripts/bench.sh NAME"
  echo "benchmarks:"; for f in "$root"/bench/*.sh; do [ -e "$f" ] && echo "  $(basename "$f" .sh)"; done
  exit 0
fi
script=$root/bench/$1.sh
[ -f "$script" ] || { echo "bench.sh: no benchmark named $1" >&2; exit 2; }
cmake --preset native-release >/dev/null
cmake --build --preset native-release >/dev/null
shift
exec bash "$script" "$root" "$root/build/native-release" "$@"
