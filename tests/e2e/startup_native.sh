#!/usr/bin/env bash
# The native program's start-up: the opening log lines, the exit code, and
# a second start against a held single-instance guard.
set -euo pipefail
program=$(realpath "$1")
here=$(cd "$(dirname "$0")" && pwd)
source "$here/log_format.sh"

work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT
export TMPDIR=$work/tmp
mkdir -p "$TMPDIR"
export IRONVALE_REGISTRY_ROOT=$work/registry

set +e
"$program" -serverDeltaTime -3.7 -hostname "test host" </dev/null >"$work/out" 2>&1
code=$?
set -e
[ "$code" -eq 1 ] || fail "exit code $code, expected 1"
# The program sees one command line rebuilt from its words.
check_opening_lines "$TMPDIR/IronvaleUpdater.log" '-serverDeltaTime -3.7 -hostname "test host"'

# A second start while another holder (this shell) has the guard.
exec 9>"$TMPDIR/IronvaleUpdater.lock"
flock -n 9 || fail "cannot take the guard"
set +e
"$program" -hostname "test host" -serverDeltaTime -3 </dev/null >"$work/out" 2>&1 9>&-
code=$?
set -e
[ "$code" -eq 255 ] || fail "second instance exit code $code, expected 255 (-1)"
grep -q "Another copy of the updater is already running." "$work/out" || fail "no instance-running message: $(cat "$work/out")"
tail -1 "$TMPDIR/IronvaleUpdater.log" | grep -q ': Error: There is already another updater instance running\.' \
  || fail "no instance-running log line"

# An elevated copy is never kept out by the guard.
set +e
"$program" -internallyElevated 1 </dev/null >"$work/out" 2>&1 9>&-
code=$?
set -e
exec 9>&-
[ "$code" -eq 1 ] || fail "elevated copy exit code $code, expected 1"
echo "startup_native: ok"
