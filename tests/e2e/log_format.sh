# Checks shared by the start-up tests: the opening lines of a run in the
# exact log-line format.
#   check_opening_lines LOGFILE COMMANDLINE
line_re() {  # LEVEL TEXT-REGEX
  printf '^[0-9]{4}-[1-9][0-9]?-[1-9][0-9]? ([1-9]?[0-9]):([1-9]?[0-9]):([1-9]?[0-9])\\.([1-9]?[0-9]{0,2}) Main\\([0-9]+\\): %s: %s\r$' "$1" "$2"
}

fail() { echo "FAIL: $*" >&2; exit 1; }

check_opening_lines() {
  local log=$1 cmdline=$2
  [ -f "$log" ] || fail "no log at $log"
  # The last run's lines start after the last separator.
  local start
  start=$(grep -n -- "-\{103\}" "$log" | tail -1 | cut -d: -f1)
  [ -n "$start" ] || fail "no separator line in the log"
  local empty sep enter cmd args
  empty=$(sed -n "$((start - 1))p" "$log")
  sep=$(sed -n "${start}p" "$log")
  enter=$(sed -n "$((start + 1))p" "$log")
  cmd=$(sed -n "$((start + 2))p" "$log")
  args=$(sed -n "$((start + 3))p" "$log")
  [[ $empty =~ $(line_re Info '') ]] || fail "empty line: '$empty'"
  [[ $sep =~ $(line_re Info "-{103}") ]] || fail "separator: '$sep'"
  [ "$(printf '%s' "$sep" | sed 's/.*: //' | tr -d '\r' | wc -c)" -eq 103 ] || fail "separator is not 103 dashes"
  [[ $enter =~ $(line_re Info 'WinMain Enter') ]] || fail "WinMain Enter: '$enter'"
  local quoted
  quoted=$(printf '%s' "$cmdline" | sed 's/[][\.*^$()+?{}|]/\\&/g')
  [[ $cmd =~ $(line_re Info "Command line: $quoted") ]] || fail "command line: '$cmd'"
  [[ $args =~ $(line_re Info 'Arguments: ServerDeltaTime=-3 InternallyElevated=0 loggedIn=1 SessionId= HostName=test host') ]] \
    || fail "arguments: '$args'"
}
