# Shared set-up of the window tests: Wine, the prefix and Xvfb come from
# the end-to-end tests' session; window_driver runs as a co-process that
# answers one line per command. Sourced after program, holder_exe,
# driver_exe, probe_exe and answer_exe are set (absolute paths).
source "$(dirname "${BASH_SOURCE[0]}")/../e2e/wine_session.sh"
caption="Ironvale - Updater"
game_key='HKCU\Software\Halvard\Ironvale'
driver_log="$(dirname "$log")/window_driver.log"
scratch=$(mktemp -d)

# Without a window manager Wine waits two seconds for one to acknowledge
# each closed box. The driver's windows are left unmanaged instead.
"$run" reg add 'HKCU\Software\Wine\AppDefaults\window_driver.exe\X11 Driver' /v Managed /t REG_SZ /d N /f >/dev/null

# The values a test sets in the game's key go again on the way out: the
# prefix is shared with the start-up tests, which expect none.
end_session() {
  [ -n "${DRIVER_PID:-}" ] && kill "$DRIVER_PID" 2>/dev/null
  "$run" reg delete "$game_key" /f >/dev/null 2>&1 || true
  rm -rf "$scratch"
}
cleanup() { end_session; }

# start_driver [NAME=VALUE...]: the driver with extra environment.
start_driver() {
  coproc DRIVER { env "$@" "$run" "$driver_exe" 2>>"$scratch/driver.err"; }
}

# post COMMAND: sends a command whose answer comes later (a box is open).
post() { echo "$1" >&"${DRIVER[1]}"; }

# answer: reads the next answer into reply.
answer() {
  read -r -t 60 reply <&"${DRIVER[0]}" || fail "no answer from the driver (stderr: $(cat "$scratch/driver.err"))"
  reply=${reply%$'\r'}
}

send() { post "$1"; answer; }

# expect_reply TEXT: the last answer must be exactly TEXT.
expect_reply() { [ "$reply" = "$1" ] || fail "driver answered '$reply', expected '$1'"; }

stop_driver() {
  exec {DRIVER[1]}>&-
  wait "$DRIVER_PID" 2>/dev/null || true
}

# window_rect: sets left and top from the driver's answer.
window_rect() {
  send rect
  read -r _ left top _ <<<"$reply"
  [ "$left" != none ] || fail "the driver has no window"
}

# probe ARGS...: window_probe at the box with the test's caption.
probe() { "$run" "$probe_exe" "$1" "$caption" "${@:2}" | tr -d '\r'; }

# press ID: presses a button of the box with the test's caption; prints the
# box's text (its first line).
press() { "$run" "$answer_exe" "$caption" "$1" 20000 | tr -d '\r' | sed -n 1p; }

# click X Y: a left click at a point of the window (client pixels).
click() { xdotool mousemove "$((left + $1))" "$((top + $2))" click 1; }
