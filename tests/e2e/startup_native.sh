#!/usr/bin/env bash
# The native program's start-up: the opening log lines in their exact
# format, the exit code, and a second start against a held single-instance
# guard.
set -euo pipefail
program=$(realpath "$1")
fail() { echo "FAIL: $*" >&2; exit 1; }
work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT
export TMPDIR=$work/tmp IRONVALE_REGISTRY_ROOT=$work/registry
log=$TMPDIR/IronvaleUpdater.log
mkdir -p "$TMPDIR"
# A machine with DirectX but no game installed: the language question is
# answered with Enter (the current one), the rest ends at the missing game.
mkdir -p "$IRONVALE_REGISTRY_ROOT/HKEY_LOCAL_MACHINE/SOFTWARE/Microsoft/DirectX"
printf 'Version\t4.09.00.0904\n' >"$IRONVALE_REGISTRY_ROOT/HKEY_LOCAL_MACHINE/SOFTWARE/Microsoft/DirectX/.values"
echo >"$work/answers"

expect_exit() {  # CODE ARGS...; the program never inherits the guard (descriptor 9)
  local expected=$1 code=0
  shift
  "$program" "$@" <"$work/answers" >"$work/out" 2>&1 9>&- || code=$?
  [ "$code" -eq "$expected" ] || fail "'$*' ended with $code, expected $expected: $(cat "$work/out")"
}

expect_exit 1 -serverDeltaTime -3.7 -hostname "test host"
grep -q "The game is not installed" "$work/out" || fail "no not-installed message: $(cat "$work/out")"
# The run's lines start with an empty one before its separator (103
# dashes); the program sees one command line rebuilt from its words.
start=$(grep -n -- "-\{103\}" "$log" | tail -1 | cut -d: -f1)
expected=('' '-{103}' 'WinMain Enter' 'Command line: -serverDeltaTime -3\.7 -hostname "test host"'
  'Arguments: ServerDeltaTime=-3 InternallyElevated=0 loggedIn=1 SessionId= HostName=test host')
for i in "${!expected[@]}"; do
  line=$(sed -n "$((start - 1 + i))p" "$log")
  [[ $line =~ ^[0-9]{4}-[1-9][0-9]?-[1-9][0-9]?\ [1-9]?[0-9]:[1-9]?[0-9]:[1-9]?[0-9]\.[1-9]?[0-9]{0,2}\ Main\([0-9]+\):\ Info:\ ${expected[$i]}$'\r'$ ]] \
    || fail "line $i of the run: '$line'"
done

# A second start while this shell holds the guard; an elevated copy is
# never kept out.
exec 9>"$TMPDIR/IronvaleUpdater.lock"
flock -n 9 || fail "cannot take the guard"
expect_exit 255 -hostname "test host"
grep -q "Another copy of the updater is already running." "$work/out" || fail "no instance-running message"
tail -1 "$log" | grep -q ': Error: There is already another updater instance running\.' \
  || fail "no instance-running log line"
expect_exit 1 -internallyElevated 1
echo "startup_native: ok"
