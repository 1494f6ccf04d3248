#!/usr/bin/env bash
# Runs a Windows program under Wine with a prefix of its own build folder and
# a warm wineserver, so each start costs ~0.1 s instead of seconds.
#   wine-run.sh PROGRAM.exe [ARGS...]
# WINEPREFIX may be set by the caller; otherwise the prefix sits beside the
# build folder's CMakeCache.txt (found upwards from the program).
set -euo pipefail
program=$1
shift
if [ -z "${WINEPREFIX:-}" ]; then
  dir=$(cd "$(dirname "$program")" && pwd)
  while [ "$dir" != / ] && [ ! -f "$dir/CMakeCache.txt" ]; do dir=$(dirname "$dir"); done
  [ "$dir" = / ] && dir=$(cd "$(dirname "$program")" && pwd)
  export WINEPREFIX="$dir/wineprefix"
fi
export WINEDEBUG=${WINEDEBUG:--all}
export WINEDLLOVERRIDES=${WINEDLLOVERRIDES:-"mscoree,mshtml="}
wine=/usr/lib/wine/wine64
server=/usr/lib/wine/wineserver

# Wine's own background processes (winedevice and friends) are started by
# the first program of a server and inherit its output. Started from here
# with no output attached, they cannot hold a caller's pipe open (CTest
# would otherwise wait for them until its time-out). The lock keeps
# parallel starts from setting up the same prefix twice; nothing started
# here may inherit it.
mkdir -p "$WINEPREFIX"
(
  flock 9
  if [ ! -f "$WINEPREFIX/system.reg" ]; then
    "$wine" wineboot --init </dev/null >/dev/null 2>&1 9>&- || true
    "$server" -w </dev/null >/dev/null 2>&1 9>&- || true
  fi
  # Exit status 0: no server ran for the prefix and a persistent one was
  # just started (2 means one runs already).
  if "$server" -p </dev/null >/dev/null 2>&1 9>&-; then
    "$wine" cmd.exe /c exit </dev/null >/dev/null 2>&1 9>&- || true
  fi
) 9>"$WINEPREFIX.lock"
exec "$wine" "$program" "$@"
