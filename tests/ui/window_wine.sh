#!/usr/bin/env bash
# The main window under Wine and Xvfb, as the player sees it on the X
# server: the bar's drawn length for a run at 0, 500 and 1000, the title,
# the status line and the "Cancel" label drawn, the colour key transparent
# without a pink fringe; "Cancel" and the close spot answered No and Yes;
# a drag. The clicks are real pointer events from xdotool.
set -euo pipefail
program=$(realpath "$1")
holder_exe=$(realpath "$2")
driver_exe=$(realpath "$3")
probe_exe=$(realpath "$4")
answer_exe=$(realpath "$5")
source "$(dirname "$0")/window_session.sh"
"$run" reg delete "$game_key" /f >/dev/null 2>&1 || true

# measure: a screenshot of the X server, measured against the background
# picture; sets bar, title, status, cancel, keyed and pinkish.
measure() {
  import -display "$DISPLAY" -window root "$scratch/screen.png"
  eval "$(/usr/bin/python3 "$root/tests/ui/window_picture.py" "$scratch/screen.png" "$left" "$top" \
            "$root/resources/pictures/background.png" | sed 's/^\([a-z]*\) \(.*\)/\1="\2"/')"
}

# bar_reaches LENGTH: waits for the window to repaint the bar. A failure
# keeps the screenshot beside the test results.
bar_reaches() {
  for _ in $(seq 40); do
    measure
    [ "$bar" -eq "$1" ] && [ "$status" -gt 100 ] && return 0
    sleep 0.25
  done
  cp "$scratch/screen.png" "$(dirname "$program")/test-results/window_wine-failed.png" 2>/dev/null || true
  fail "bar drawn $bar px long (status line: $status changed pixels), expected $1"
}

start_driver
send start
window_rect
[ "$left" -eq $(((1024 - 532) / 2)) ] && [ "$top" -eq $(((768 - 481) / 2)) ] || fail "window at $left,$top, not centred"
send "status File: data/levels/level2.map"
for step in "0 0" "500 165" "1000 330"; do
  read -r value length <<<"$step"
  send "overall $value"
  send "file $value"
  bar_reaches "$length"
  echo "progress $value: bar $length px, title $title, status $status, cancel $cancel, keyed $keyed, pinkish $pinkish"
  [ "$title" -gt 100 ] && [ "$cancel" -gt 50 ] || fail "title or Cancel label not drawn"
  [ "${keyed%/*}" = "${keyed#*/}" ] && [ "${keyed#*/}" -gt 0 ] || fail "colour-key pixels not transparent: $keyed"
  [ "$pinkish" -eq 0 ] || fail "$pinkish pixels near the colour key (a fringe)"
done

# "Cancel" answered No: the run goes on and the bar still follows it. The
# main thread waits while the question is open.
click 435 443
post wait
text=$(press 7)
[ "$text" = "Are you sure you want to cancel?" ] || fail "Cancel asked: '$text'"
answer
expect_reply "state cancelled=0 cancels=0 quit=0 window=1"
send "overall 0"
send "file 0"
bar_reaches 0

# A drag from the title line moves the window by the pointer's way.
xdotool mousemove $((left + 100)) $((top + 15)) mousedown 1 mousemove $((left + 150)) $((top + 45)) mouseup 1
before="$left $top"
for _ in $(seq 20); do
  window_rect
  [ "$left $top" != "$before" ] && break
  sleep 0.1
done
[ "$left $top" = "296 173" ] || fail "dragged by 50,30 from $before, window now at $left $top"

# The close spot answered Yes: cancelled once, the LZMA loop's flag set,
# the window gone.
click 515 15
text=$(press 6)
[ "$text" = "Are you sure you want to quit?" ] || fail "close spot asked: '$text'"
send wait
expect_reply "state cancelled=1 cancels=1 quit=1 window=0"
send stop
stop_driver

# A new run: the close spot answered No, then "Cancel" answered Yes.
start_driver
send start
window_rect
click 515 15
[ "$(press 7)" = "Are you sure you want to quit?" ] || fail "close spot asked something else"
send wait
expect_reply "state cancelled=0 cancels=0 quit=0 window=1"
click 435 443
[ "$(press 6)" = "Are you sure you want to cancel?" ] || fail "Cancel asked something else"
send wait
expect_reply "state cancelled=1 cancels=1 quit=1 window=0"
stop_driver
echo "window_wine: ok"
