#!/usr/bin/env bash
# Seeds for vcdiff_fuzz: small xdelta3 deltas of every interop case, each
# packed with its source as the fuzz target expects.
#   vcdiff_fuzz_seeds.sh OUTDIR
set -euo pipefail
[ $# -eq 1 ] || { echo "usage: $0 OUTDIR" >&2; exit 2; }
exec python3 "$(dirname "$0")/../patch/make_xdelta3_cases.py" --fuzz-seeds "$1"
