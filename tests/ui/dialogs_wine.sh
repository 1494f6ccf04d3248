#!/usr/bin/env bash
# The boxes and the language dialog under Wine and Xvfb, in the language
# stored in the game's registry key: the language dialog lists the eight
# languages with the current one selected and its choice is stored; every
# kind of box the program shows carries the lexicon's button labels, on
# the main thread and on the window's thread; the Japanese font search
# with and without a Japanese font installed.
set -euo pipefail
program=$(realpath "$1")
holder_exe=$(realpath "$2")
driver_exe=$(realpath "$3")
probe_exe=$(realpath "$4")
answer_exe=$(realpath "$5")
source "$(dirname "$0")/window_session.sh"

set_value() { "$run" reg add "$game_key" /v "$1" /t REG_SZ /d "$2" /f >/dev/null; }
# The updater finds its key by the installation folder.
set_value "Install Dir" 'C:\Games\Ironvale'
set_value Language German
caption="Ironvale - Update"

# expect_buttons "ID LABEL"...: the box's buttons, exactly.
expect_buttons() {
  local shown wanted
  shown=$(probe buttons | sort)
  wanted=$(printf '%s\n' "$@" | sort)
  [ "$shown" = "$wanted" ] || fail "buttons: $(echo $shown), expected: $*"
}

start_driver
post language
listed=$(probe combo 1006)
[ "$listed" = "$(printf 'item %s\n' English French German Italian Japanese Polish Russian Spanish; echo 'selected German')" ] \
  || fail "language list: $(echo $listed)"
expect_buttons "1 OK" "2 Abbrechen"
probe select 1006 Polish
press 1 >/dev/null
answer
expect_reply "language Polish"
"$run" reg query "$game_key" /v Language | tr -d '\r' | grep -q 'REG_SZ *Polish$' || fail "Polish not stored"

post retry
expect_buttons "4 Wiederholen" "2 Abbrechen"
press 2 >/dev/null
answer
expect_reply "answer cancel"
post "error Hinweis"
expect_buttons "1 OK"
press 1 >/dev/null
answer
# A question of the main thread owned by the window, and the confirmation
# from the window's own thread with its own hook.
send start
window_rect
post "ask Weiter?"
expect_buttons "6 Ja" "7 Nein"
press 7 >/dev/null
answer
expect_reply "answer no"
click 435 443
expect_buttons "6 Ja" "7 Nein"
press 7 >/dev/null
send stop
stop_driver

# The updater's own first box, before any window: the instance-running
# warning, in Spanish, whose OK differs from the system's.
set_value Language Spanish
"$run" "$holder_exe" 60000 >"$scratch/holder.out" 2>&1 &
holder=$!
for _ in $(seq 100); do grep -q held "$scratch/holder.out" 2>/dev/null && break; sleep 0.1; done
"$run" "$program" &
second=$!
caption="Ironvale - Actualizador"
expect_buttons "1 Aceptar"
press 1 >/dev/null
wait "$second" || true
kill "$holder" 2>/dev/null || true
wait "$holder" 2>/dev/null || true

# Japanese. Wine finds fonts through fontconfig and remembers them in its
# registry; each case gets a fontconfig of its own and starts with Wine's
# memory of the Japanese fonts cleared.
set_value Language Japanese
caption=$(awk -F'\t' '$1 == "INSTALLER_GAME_NAME" { g = $6 } $1 == "INSTALLER_UPDATER_HEADER" { h = $6 }
                      END { print g " - " h }' "$root/resources/strings.tsv")
forget_fonts() {
  "$run" reg delete 'HKCU\Software\Wine\Fonts\Cache' /f >/dev/null 2>&1 || true
  "$run" reg delete 'HKCU\Software\Wine\Fonts\External Fonts' /f >/dev/null 2>&1 || true
  for face in IPAGothic IPAPGothic @IPAGothic @IPAPGothic; do
    "$run" reg delete 'HKLM\Software\Microsoft\Windows NT\CurrentVersion\Fonts' /v "$face (TrueType)" /f >/dev/null 2>&1 || true
  done
}
fonts_in() {  # NAME FOLDER...: a fontconfig that knows only these folders
  { echo '<?xml version="1.0"?><fontconfig>'
    printf '<dir>%s</dir>' "${@:2}"
    echo "<cachedir>$scratch/fontcache</cachedir></fontconfig>"; } >"$scratch/$1.conf"
}
fonts_in latin /usr/share/fonts/truetype/dejavu
fonts_in japanese /usr/share/fonts/truetype/dejavu /usr/share/fonts/opentype/ipafont-gothic
cleanup() { forget_fonts; end_session; }

# No Japanese font: no font is made, and each request searches again.
forget_fonts
: >"$driver_log"
start_driver FONTCONFIG_FILE="$scratch/latin.conf"
send dialogfont
expect_reply "dialogfont none"
send dialogfont
expect_reply "dialogfont none"
stop_driver
[ "$(grep -c 'Trace: Finding dialog font\.\.\.' "$driver_log")" -eq 2 ] || fail "the search did not repeat"
! grep -q 'Created font:' "$driver_log" || fail "a font was made without a Japanese font"

# A Japanese font, none of the candidates: the system's choice for an
# empty face name at the default size, made once, while the boxes (which
# the hook gives that font) still get their labels.
forget_fonts
: >"$driver_log"
start_driver FONTCONFIG_FILE="$scratch/japanese.conf"
send dialogfont
expect_reply "dialogfont '' 14 400 'IPAGothic'"
post "ask 続けますか?"
expect_buttons "6 はい" "7 いいえ"
press 6 >/dev/null
answer
stop_driver
[ "$(grep -c 'Trace: Finding dialog font\.\.\.' "$driver_log")" -eq 1 ] || fail "the font was searched again"
grep -q 'Info: Created font: IPAGothic' "$driver_log" || fail "no 'Created font: IPAGothic' line"
echo "dialogs_wine: ok"
