# Shared set-up of the end-to-end tests that run IronvaleUpdater.exe under
# Wine. Sourced after `program` and `holder_exe` are set (absolute paths);
# sets `root`, `run`, `WINEPREFIX` and `log`, and provides start_display.
here=$(cd "$(dirname "${BASH_SOURCE[0]}")" && pwd)
root=$(cd "$here/../.." && pwd)
run="$root/scripts/wine-run.sh"
source "$here/log_format.sh"

# One prefix per build folder, created by the wrapper on first use.
export WINEPREFIX="$(dirname "$program")/wineprefix"
"$run" "$holder_exe" 0 >/dev/null 2>&1 || true
log="$WINEPREFIX/drive_c/users/$(id -un)/Temp/IronvaleUpdater.log"
[ -d "$(dirname "$log")" ] || log="$WINEPREFIX/drive_c/users/$(id -un)/AppData/Local/Temp/IronvaleUpdater.log"

# Message boxes need a display: a private Xvfb, its process id in `xvfb`
# for the caller's clean-up.
start_display() {
  local display=:$((90 + RANDOM % 100))
  Xvfb "$display" -screen 0 1024x768x24 -nolisten tcp >/dev/null 2>&1 &
  xvfb=$!
  export DISPLAY=$display
  sleep 1
}
