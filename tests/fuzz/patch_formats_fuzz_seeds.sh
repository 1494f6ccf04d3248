#!/usr/bin/env bash
# patch_formats_fuzz_seeds.sh OUTDIR: small xdelta3 deltas of every interop
# case, each packed with its source as the fuzz target expects.
exec python3 "$(dirname "$0")/../patch/make_xdelta3_cases.py" --fuzz-seeds "$1"
