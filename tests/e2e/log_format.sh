# Checks shared by the start-up tests: the opening lines of a run in the
# exact log-line format.
fail() { echo "FAIL: $*" >&2; exit 1; }

check_opening_lines() {  # LOGFILE COMMANDLINE (run with -serverDeltaTime -3.x -hostname "test host")
  local log=$1 start line i expected
  [ -f "$log" ] || fail "no log at $log"
  # The last run's lines start before its separator, 103 dashes.
  start=$(grep -n -- "-\{103\}" "$log" | tail -1 | cut -d: -f1)
  [ -n "$start" ] || fail "no separator line in the log"
  expected=('' '-{103}' 'WinMain Enter' "Command line: $(printf '%s' "$2" | sed 's/[][\.*^$()+?{}|]/\\&/g')"
    'Arguments: ServerDeltaTime=-3 InternallyElevated=0 loggedIn=1 SessionId= HostName=test host')
  for i in "${!expected[@]}"; do
    line=$(sed -n "$((start - 1 + i))p" "$log")
    [[ $line =~ ^[0-9]{4}-[1-9][0-9]?-[1-9][0-9]?\ ([1-9]?[0-9]):([1-9]?[0-9]):([1-9]?[0-9])\.([1-9]?[0-9]{0,2})\ Main\([0-9]+\):\ Info:\ ${expected[$i]}$'\r'$ ]] \
      || fail "line $i of the run: '$line'"
  done
}
