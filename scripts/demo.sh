#!/usr/bin/env bash
# Builds what is missing and runs the updater once with a sample command
# line: the Windows program under Wine when Wine is installed, the native
# build otherwise. Prints the log the run wrote.
set -euo pipefail
root=$(cd "$(dirname "$0")/.." && pwd)
cd "$root"
command -v cmake >/dev/null && [ -e /usr/include/tinyxml.h ] || bash scripts/setup.sh
sample=(-latestVersion 2 -hostname demo.ironvale.test -serverDeltaTime 5)

if [ -x /usr/lib/wine/wine64 ] && command -v x86_64-w64-mingw32-g++-posix >/dev/null; then
  echo "== building the Windows program"
  cmake --preset windows >/dev/null
  cmake --build --preset windows --target IronvaleUpdater >/dev/null
  export WINEPREFIX=$root/build/windows/wineprefix
  echo "== running IronvaleUpdater.exe ${sample[*]} under Wine"
  set +e
  scripts/wine-run.sh build/windows/IronvaleUpdater.exe "${sample[@]}"
  code=$?
  set -e
  log=$(find "$WINEPREFIX/drive_c/users" -name IronvaleUpdater.log | head -1)
else
  echo "== building the native program"
  cmake --preset native >/dev/null
  cmake --build --preset native --target IronvaleUpdater >/dev/null
  export TMPDIR=$root/build/native/demo-tmp
  mkdir -p "$TMPDIR"
  echo "== running IronvaleUpdater ${sample[*]}"
  set +e
  build/native/IronvaleUpdater "${sample[@]}" </dev/null
  code=$?
  set -e
  log=$TMPDIR/IronvaleUpdater.log
fi
echo "== exit code: $code"
echo "== the run's lines of $log"
# The last run starts at the last separator line (one line before it is empty).
start=$(grep -n -- '-\{103\}' "$log" | tail -1 | cut -d: -f1)
tail -n +"$((start - 1))" "$log" | tr -d '\r'
