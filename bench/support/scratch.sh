# Sourced by the benchmarks. make_scratch NAME sets work to a new folder,
# memory-backed when there is some so the disk does not decide the result;
# on exit it goes, with the loopback nginx start_nginx may have started.
nginx_pid=
make_scratch() {
  local parent=${TMPDIR:-/tmp}
  [ -d /dev/shm ] && [ -w /dev/shm ] && parent=/dev/shm
  work=$(mktemp -d "$parent/ivl-bench-$1.XXXXXX")
  trap remove_scratch EXIT
}
remove_scratch() {
  [ -n "$nginx_pid" ] && kill "$nginx_pid" 2>/dev/null && wait "$nginx_pid" 2>/dev/null
  rm -rf "$work"
}
