#!/usr/bin/env bash
# IronvaleUpdater.exe under Wine: the opening log lines and exit code, and
# the instance-running box of a second start, answered by dialog_answer.
set -euo pipefail
program=$(realpath "$1")
holder_exe=$(realpath "$2")
answer_exe=$(realpath "$3")
source "$(dirname "$0")/wine_session.sh"
start_display
trap 'kill $xvfb 2>/dev/null || true' EXIT

set +e
"$run" "$program" -serverDeltaTime -3.7 -hostname "test host"
code=$?
set -e
[ "$code" -eq 1 ] || fail "exit code $code, expected 1"
check_opening_lines "$log" '-serverDeltaTime -3.7 -hostname "test host"'

# Second start while another process holds the mutex.
"$run" "$holder_exe" 60000 >"$WINEPREFIX/holder.out" 2>&1 &
holder=$!
for _ in $(seq 100); do grep -q held "$WINEPREFIX/holder.out" 2>/dev/null && break; sleep 0.1; done
grep -q held "$WINEPREFIX/holder.out" || fail "the holder did not take the mutex"
"$run" "$program" -hostname "test host" &
second=$!
text=$("$run" "$answer_exe" "Ironvale - Updater" 1 30000 | tr -d '\r')
set +e
wait "$second"
code=$?
set -e
kill "$holder" 2>/dev/null || true
wait "$holder" 2>/dev/null || true
echo "$text"
[ "$code" -eq 255 ] || fail "second instance exit code $code, expected 255 (-1)"
grep -q "Another copy of the updater is already running." <<<"$text" || fail "box text: $text"
tail -1 "$log" | grep -q ': Error: There is already another updater instance running\.' || fail "no instance-running log line"
echo "startup_wine: ok"
