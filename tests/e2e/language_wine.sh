#!/usr/bin/env bash
# IronvaleUpdater.exe under Wine speaks the language stored in the game's
# registry key: the instance-running box of a second start, and its caption,
# come from that language's column of the string table. Once from the
# current user's key, once from the key of the user named by -SID (as an
# elevated copy reads it).
set -euo pipefail
program=$(realpath "$1")
holder_exe=$(realpath "$2")
answer_exe=$(realpath "$3")
source "$(dirname "$0")/wine_session.sh"
# The prefix is shared with the other start-up test, which expects English:
# every value set here is removed again on the way out.
user_key='HKCU\Software\Halvard\Ironvale'
sid='S-1-5-21-4242-4242-4242-1001'
sid_key="HKU\\$sid"

cleanup() {
  "$run" reg delete "$user_key" /f >/dev/null 2>&1 || true
  "$run" reg delete "$sid_key" /f >/dev/null 2>&1 || true
  [ -n "${xvfb:-}" ] && kill "$xvfb" 2>/dev/null || true
}
trap cleanup EXIT

# A text of the built-in table: column 2 is English, then FRE GER ITA JPN POL RUS SPA.
table_text() {  # KEY COLUMN
  awk -F'\t' -v key="$1" -v column="$2" '$1 == key { print $column }' "$root/resources/strings.tsv"
}

start_display

# second_start LANGUAGE COLUMN [ARGS...]: starts the updater while another
# process holds the single-instance guard and checks the box it shows.
second_start() {
  local language=$1 column=$2
  shift 2
  local caption expected english text code
  caption="$(table_text INSTALLER_GAME_NAME "$column") - $(table_text INSTALLER_UPDATER_HEADER "$column")"
  expected=$(table_text INSTALLER_INSTANCE_RUNNING "$column")
  english=$(table_text INSTALLER_INSTANCE_RUNNING 2)
  [ -n "$expected" ] && [ "$expected" != "$english" ] || fail "$language: no translated text in the table"

  "$run" "$holder_exe" 60000 >"$WINEPREFIX/holder.out" 2>&1 &
  local holder=$!
  for _ in $(seq 100); do grep -q held "$WINEPREFIX/holder.out" 2>/dev/null && break; sleep 0.1; done
  grep -q held "$WINEPREFIX/holder.out" || fail "the holder did not take the mutex"
  "$run" "$program" "$@" &
  local second=$!
  text=$("$run" "$answer_exe" "$caption" 1 30000 | tr -d '\r') || true
  set +e
  wait "$second"
  code=$?
  set -e
  kill "$holder" 2>/dev/null || true
  wait "$holder" 2>/dev/null || true
  echo "$language: $text"
  [ "$code" -eq 255 ] || fail "$language: second instance exit code $code, expected 255 (-1)"
  grep -qF -- "$expected" <<<"$text" || fail "$language: box text '$text', expected '$expected' under caption '$caption'"
}

"$run" reg add "$user_key" /v "Install Dir" /t REG_SZ /d 'C:\Games\Ironvale' /f >/dev/null
"$run" reg add "$user_key" /v Language /t REG_SZ /d German /f >/dev/null
second_start German 4 -hostname "test host"
"$run" reg delete "$user_key" /f >/dev/null

"$run" reg add "$sid_key\\Software\\Halvard\\Ironvale" /v "Install Dir" /t REG_SZ /d 'C:\Games\Ironvale' /f >/dev/null
"$run" reg add "$sid_key\\Software\\Halvard\\Ironvale" /v Language /t REG_SZ /d Polish /f >/dev/null
second_start Polish 7 -SID "$sid"
echo "language_wine: ok"
