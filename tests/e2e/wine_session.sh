# Shared set-up of the tests that run IronvaleUpdater.exe under Wine,
# sourced with the script's arguments (the updater, hold_instance,
# dialog_answer). Sets `root`, `run`, `WINEPREFIX` and `log`, defines
# `fail` and `second_start`, and starts a private display for the boxes,
# stopped on exit after the caller's `cleanup` (if it defines one).
set -euo pipefail
program=$(realpath "$1")
holder_exe=$(realpath "$2")
answer_exe=$(realpath "$3")
root=$(cd "$(dirname "${BASH_SOURCE[0]}")/../.." && pwd)
run="$root/scripts/wine-run.sh"
fail() { echo "FAIL: $*" >&2; exit 1; }

# One prefix per build folder, created by the wrapper on first use.
export WINEPREFIX="$(dirname "$program")/wineprefix"
"$run" "$holder_exe" 0 >/dev/null 2>&1 || true
log="$WINEPREFIX/drive_c/users/$(id -un)/Temp/IronvaleUpdater.log"
[ -d "$(dirname "$log")" ] || log="$WINEPREFIX/drive_c/users/$(id -un)/AppData/Local/Temp/IronvaleUpdater.log"

# The X server picks a free display number itself and says it once it is
# ready: other tests on the machine run displays of their own. It must not
# reset when its last client leaves. Wine's desktop process stays tied to
# the display it was started on, so the prefix's Wine processes end before
# the session begins and again before its display goes.
end_wine() { { /usr/lib/wine/wineserver -k; /usr/lib/wine/wineserver -w; } 2>/dev/null || true; }
end_wine
display_file=$(mktemp)
Xvfb -displayfd 3 -screen 0 1024x768x24 -nolisten tcp -noreset 3>"$display_file" >/dev/null 2>&1 &
xvfb=$!
trap '! declare -F cleanup >/dev/null || cleanup; end_wine; kill $xvfb 2>/dev/null || true; rm -f "$display_file"' EXIT
for _ in $(seq 200); do [ -s "$display_file" ] && break; sleep 0.05; done
[ -s "$display_file" ] || fail "Xvfb did not start"
export DISPLAY=:$(head -1 "$display_file")

# second_start CAPTION [ARGS...]: the updater started while hold_instance
# has the single-instance guard must say so in a box (its text lands in
# `text` and OK is pressed), in its log, and by ending with -1.
second_start() {
  local caption=$1 holder second code=0
  shift
  "$run" "$holder_exe" 60000 >"$WINEPREFIX/holder.out" 2>&1 &
  holder=$!
  for _ in $(seq 100); do grep -q held "$WINEPREFIX/holder.out" 2>/dev/null && break; sleep 0.1; done
  grep -q held "$WINEPREFIX/holder.out" || fail "the holder did not take the mutex"
  "$run" "$program" "$@" &
  second=$!
  text=$("$run" "$answer_exe" "$caption" 1 30000 | tr -d '\r') || true
  wait "$second" || code=$?
  kill "$holder" 2>/dev/null || true
  wait "$holder" 2>/dev/null || true
  echo "$caption: $text"
  [ "$code" -eq 255 ] || fail "second instance exit code $code, expected 255 (-1)"
  tail -1 "$log" | grep -q ': Error: There is already another updater instance running\.' || fail "no log line"
}
