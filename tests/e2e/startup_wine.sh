#!/usr/bin/env bash
# IronvaleUpdater.exe under Wine: the opening log lines and exit code, and
# the instance-running box of a second start, in English and in the
# language stored in the game's registry key: the current user's, or that
# of the user named by -SID (as an elevated copy reads it).
source "$(dirname "$0")/wine_session.sh"
# No game installed and no language chosen: the language dialog (OK keeps
# the current one), then the box that says the game is not installed.
code=0
"$run" "$program" -serverDeltaTime -3.7 -hostname "test host" &
first=$!
"$run" "$answer_exe" "Ironvale - Updater" 1 30000 >/dev/null || fail "no language dialog"
text=$("$run" "$answer_exe" "Ironvale - Updater" 1 30000 | tr -d '\r') || fail "no box after the language dialog"
wait "$first" || code=$?
[ "$code" -eq 1 ] || fail "exit code $code, expected 1"
grep -q "The game is not installed" <<<"$text" || fail "box text: $text"
check_opening_lines "$log" '-serverDeltaTime -3.7 -hostname "test host"'
second_start "Ironvale - Updater" -hostname "test host"
grep -q "Another copy of the updater is already running." <<<"$text" || fail "box text: $text"

key='Software\Halvard\Ironvale'
sid='S-1-5-21-4242-4242-4242-1001'
# The prefix outlives the test: no language may stay behind.
cleanup() { for k in "HKCU\\$key" "HKU\\$sid"; do "$run" reg delete "$k" /f >/dev/null 2>&1 || true; done; }
table_text() {  # KEY COLUMN: 2 is English, then FRE GER ITA JPN POL RUS SPA
  awk -F'\t' -v key="$1" -v column="$2" '$1 == key { print $column }' "$root/resources/strings.tsv"
}
check_language() {  # HIVE LANGUAGE COLUMN [ARGS...]
  local hive=$1 language=$2 column=$3 expected
  shift 3
  expected=$(table_text INSTALLER_INSTANCE_RUNNING "$column")
  [ -n "$expected" ] && [ "$expected" != "$(table_text INSTALLER_INSTANCE_RUNNING 2)" ] || fail "$language: not translated"
  "$run" reg add "$hive\\$key" /v "Install Dir" /t REG_SZ /d 'C:\Games\Ironvale' /f >/dev/null
  "$run" reg add "$hive\\$key" /v Language /t REG_SZ /d "$language" /f >/dev/null
  second_start "$(table_text INSTALLER_GAME_NAME "$column") - $(table_text INSTALLER_UPDATER_HEADER "$column")" "$@"
  cleanup
  grep -qF -- "$expected" <<<"$text" || fail "$language: box text '$text', expected '$expected'"
}
check_language HKCU German 4 -hostname "test host"
check_language "HKU\\$sid" Polish 7 -SID "$sid"
echo "startup_wine: ok"
