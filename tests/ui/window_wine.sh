#!/usr/bin/env bash
# The Windows program's window, boxes and fonts under Wine and Xvfb as the player meets them, in German, whose button
# labels differ from the system's: window_driver shows them as the update run does and answers its boxes, xdotool
# clicks and drags, window_picture.py reads the screen.
#   window_wine.sh UPDATER HOLD_INSTANCE DIALOG_ANSWER WINDOW_DRIVER
set -euo pipefail
program=$(realpath "$1")
holder_exe=$(realpath "$2")
answer_exe=$(realpath "$3")
driver_exe=$(realpath "$4")
root=$(cd "$(dirname "$0")/../.." && pwd)
run="$root/scripts/wine-run.sh"
fail() { echo "FAIL: $*" >&2; exit 1; }

# One prefix per build folder, created by the wrapper on first use.
export WINEPREFIX="$(dirname "$program")/wineprefix"
"$run" "$holder_exe" 0 >/dev/null 2>&1 || true
log="$WINEPREFIX/drive_c/users/$(id -un)/Temp/IronvaleUpdater.log"

# The X server picks a free display number itself and writes it to a file once it is ready. It must not reset when its
# last client leaves. Wine's desktop process stays tied to the display it was started on, so the prefix's Wine
# processes end before the session begins and again before its display goes, which is gone before the next test.
end_wine() { { /usr/lib/wine/wineserver -k; /usr/lib/wine/wineserver -w; } 2>/dev/null || true; }
end_wine
retry() { for _ in $(seq 100); do "$@" && return; sleep 0.1; done; false; }  # COMMAND...: for ten seconds
display_file=$(mktemp)
Xvfb -displayfd 3 -screen 0 1024x768x24 -nolisten tcp -noreset 3>"$display_file" >/dev/null 2>&1 & xvfb=$!
trap 'cleanup; end_wine; kill $xvfb 2>/dev/null; wait $xvfb 2>/dev/null; rm -f "$display_file"' EXIT
retry test -s "$display_file" || fail "Xvfb did not start"
export DISPLAY=:$(head -1 "$display_file")
key='HKCU\Software\Halvard\Ironvale'
driver_log="$(dirname "$log")/window_driver.log"
scratch=$(mktemp -d)
# Without a window manager Wine waits two seconds for one after each box.
"$run" reg add 'HKCU\Software\Wine\AppDefaults\window_driver.exe\X11 Driver' /v Managed /t REG_SZ /d N /f >/dev/null
set_value() { "$run" reg add "$key" /v "$1" /t REG_SZ /d "$2" /f >/dev/null; }
german() { awk -F'\t' -v key="$1" '$1 == key { print $4 }' "$root/resources/strings.tsv"; }
forget_fonts() {
  for k in Cache 'External Fonts'; do "$run" reg delete "HKCU\\Software\\Wine\\Fonts\\$k" /f >/dev/null 2>&1 || true; done
  for face in IPAGothic IPAPGothic @IPAGothic @IPAPGothic; do
    "$run" reg delete 'HKLM\Software\Microsoft\Windows NT\CurrentVersion\Fonts' /v "$face (TrueType)" /f >/dev/null 2>&1 || true
  done
}
# The prefix is shared with the other Wine tests: the game's key and Wine's
# memory of this test's fonts go.
cleanup() { forget_fonts; "$run" reg delete "$key" /f >/dev/null 2>&1 || true; rm -rf "$scratch"; }

start_driver() { : >"$driver_log"; coproc DRIVER { "$run" "$driver_exe" 2>>"$scratch/driver.err"; }; }
stop_driver() { exec {DRIVER[1]}>&-; wait "$DRIVER_PID" 2>/dev/null || true; }
send() {
  echo "$1" >&"${DRIVER[1]}"
  read -r -t 60 reply <&"${DRIVER[0]}" || fail "no answer to '$1' (stderr: $(cat "$scratch/driver.err"))"
  reply=${reply%$'\r'}
}
expect() { send "$1"; [ "$reply" = "$2" ] || fail "'$1' answered '$reply', expected '$2'"; }
click() { xdotool mousemove "$((left + $1))" "$((top + $2))" click 1; }

set_value "Install Dir" 'C:\Games\Ironvale'  # the updater finds its key by it
set_value Language German
start_driver
expect "language 1 Polish" \
  "Polish | [1 OK] [2 Abbrechen] {English French German Italian Japanese Polish Russian Spanish} German"
"$run" reg query "$key" /v Language | grep -q 'REG_SZ *Polish' || fail "the choice was not stored"
expect "retry 2" "cancel | $(german INSTALLER_FAILED_TO_MOVE_THE_FILE) [4 Wiederholen] [2 Abbrechen]"
expect start started
expect rect "246 143"  # centred on the 1024 x 768 screen
left=246 top=143
bar() {  # VALUE LENGTH: at that progress the screen shows the window, its bar LENGTH px long
  expect "progress $1" ok
  /usr/bin/python3 "$root/tests/ui/window_picture.py" $left $top "$2" "$root/resources/pictures/background.png" \
    "$(dirname "$program")/test-results/window_wine-failed.png" || fail "progress $1: the window as drawn is wrong"
}
bar 0 0
bar 500 165
# A drag from the title line moves the window by the pointer's way. The next picture waits for the screen to show it
# there, where clicks go.
xdotool mousemove 346 158 mousedown 1 mousemove 396 188 mouseup 1
moved() { send rect; [ "$reply" = "296 173" ]; }
retry moved || fail "the drag left the window at $reply"
left=296 top=173
bar 1000 330
# A question of the main thread owned by the window, then the confirmations of the window's thread (with its own
# hook) answered No: the run goes on, and the bar still follows it.
yes_no="[6 Ja] [7 Nein]"
expect "ask 7 Weiter?" "no | Weiter? $yes_no"
going="cancels=0 window=1"
click 435 443  # "Cancel"
expect "confirm 7" "$going | $(german INSTALLER_CONFIRM_CANCEL) $yes_no"
click 515 15  # the close spot
expect "confirm 7" "$going | $(german INSTALLER_CONFIRM_QUIT) $yes_no"
bar 0 0
# Yes: cancelled once, the LZMA loop's flag set, the window gone.
click 515 15
expect "confirm 6" "cancels=1 window=0 | $(german INSTALLER_CONFIRM_QUIT) $yes_no"
stop_driver

# The updater's own first box, before any window: the instance-running warning (in a box whose OK differs from
# the system's in Spanish, in its log, and by ending with -1).
set_value Language Spanish
"$run" "$holder_exe" 60000 >"$scratch/holder.out" 2>&1 & holder=$!
retry grep -q held "$scratch/holder.out" || fail "the holder did not take the mutex"
"$run" "$program" & second=$!
text=$("$run" "$answer_exe" "Ironvale - Actualizador" 1 30000 | tr -d '\r') || true
wait "$second" && code=0 || code=$?
kill "$holder"; wait "$holder" 2>/dev/null || true
grep -qx '\[button\] Aceptar' <<<"$text" || fail "the instance-running box's button: $text"
[ "$code" -eq 255 ] || fail "second instance exit code $code, expected 255 (-1)"
tail -1 "$log" | grep -q ': Error: There is already another updater instance running\.' || fail "no log line"

# Japanese. Wine finds fonts through fontconfig and remembers them in its registry and in every running Wine process:
# each case gets a fontconfig of its own, the memory is cleared and the Wine processes end before the driver starts.
set_value Language Japanese
with_fonts() {  # NAME FOLDER...: the driver, knowing only these fonts
  export FONTCONFIG_FILE="$scratch/$1.conf"
  echo "<fontconfig>$(printf '<dir>%s</dir>' "${@:2}")<cachedir>$scratch/fontcache</cachedir></fontconfig>" >"$FONTCONFIG_FILE"
  forget_fonts; end_wine; start_driver
}
searched() { [ "$(grep -c 'Trace: Finding dialog font' "$driver_log")" -eq "$1" ] || fail "font not searched $1 times"; }
# No Japanese font: no font is made, and each request searches again.
with_fonts latin /usr/share/fonts/truetype/dejavu
expect dialogfont none
expect dialogfont none
stop_driver
searched 2
# A Japanese font, none of the candidates: the system's choice for an empty face name at the default size, made once;
# the boxes, which the hook gives that font, keep their labels.
with_fonts japanese /usr/share/fonts/truetype/dejavu /usr/share/fonts/opentype/ipafont-gothic
expect dialogfont "'' 14 400"
expect "ask 6 OK?" "yes | OK? [6 はい] [7 いいえ]"
stop_driver
searched 1
grep -q 'Info: Created font: IPAGothic' "$driver_log" || fail "the system did not choose IPAGothic"
echo "window_wine: ok"
