#!/usr/bin/env bash
# The whole update, end to end, against its two halves measured in the same
# run: a generated installation (SIZE_MIB, default 1024, in FILES files,
# default 300) and a patch from ironvale-patch build rebuilding 20% of the
# files (about 5% of each edited) and adding a tenth in new files, in archives
# of at most 16 MiB, served by a loopback nginx.
#   download: curl fetching the same archives, one after the other
#   apply:    ironvale-patch apply from the archives on disk
#   update:   the native IronvaleUpdater, built with the server as its
#             location, answering Yes to the update and No to the game
# The program's first version check deliberately shows its bar for three
# seconds; the update is printed with and without that pause. The goal is
# update (without the pause) <= 1.15 x max(download, apply), which only
# downloading while preparing can reach. Peak RSS is printed for apply and
# update; run with a smaller SIZE_MIB to see that it does not follow the
# installation's size.
#   bench/update.sh ROOT BUILD_DIR   (ROUNDS=N default 3, SIZE_MIB, FILES)
set -euo pipefail
root=$1
build=$2
rounds=${ROUNDS:-3}
size_mib=${SIZE_MIB:-1024}
files=${FILES:-300}
tool=$build/tools/ironvale-patch

for needed in nginx curl python3 xdelta3; do
  command -v "$needed" >/dev/null || { echo "update bench: $needed is missing" >&2; exit 2; }
done

# The installation is copied afresh for every run.
source "$root/bench/support/scratch.sh"
make_scratch update
cd "$work"

echo "making the installation, the new version and the patch ($size_mib MiB in $files files)"
python3 - "$root/tests/patch" "$size_mib" "$files" <<'PY'
import os, random, sys
sys.path.insert(0, sys.argv[1])
from make_xdelta3_cases import edit
size, count = int(sys.argv[2]) << 20, int(sys.argv[3])
rng = random.Random(1024)
for i in range(count):
    name = "data%02d/file%04d.bin" % (i % 16, i)
    for tree in ("v1", "v2"):
        os.makedirs(os.path.dirname(tree + "/" + name), exist_ok=True)
    length = int(size / count * (0.5 + rng.random()))
    data = rng.randbytes(length)
    open("v1/" + name, "wb").write(data)
    if i % 5 == 0:
        data = edit(rng, data, max(1, length // 1300), 128)
    open("v2/" + name, "wb").write(data)
    if i % 10 == 3:
        # New files, a tenth of the size: what the archives mostly carry.
        os.makedirs("v2/new", exist_ok=True)
        open("v2/new/file%04d.bin" % i, "wb").write(rng.randbytes(length))
PY
"$tool" version --out www 2 >/dev/null
"$tool" build --from v1 --to v2 --version 2 --out www --max-archive-size $((16 << 20)) >/dev/null
patch=$(find www -maxdepth 1 -name 'patch_*' | head -1)
mapfile -t archives < <(cd "$patch" && ls -- *.lzma | sort)
echo "  $(du -sh v1 | cut -f1) installed, ${#archives[@]} archives of $(du -ch "$patch"/*.lzma | tail -1 | cut -f1)"

source "$root/bench/support/loopback_nginx.sh"
start_nginx "$work" version.txt
location=http://127.0.0.1:$port

# The program with this server built in.
source "$root/bench/support/installed_game.sh"
build_updater "$location" IronvaleUpdater
use_registry "$work/install"

check_installation() {  # NAME
  diff -r -q -x InstallationData.xml -x Uninstall.xml -x UpdateHistory.log install v2 >/dev/null ||
    { echo "update bench: $1 left the installation different from version 2" >&2; exit 1; }
}

measure() {  # NAME: appends "seconds kilobytes" to NAME.times
  local name=$1
  rm -rf download
  reset_installation v1 install
  case $name in
    download)
      local arguments=()
      mkdir -p download
      for archive in "${archives[@]}"; do arguments+=(-o "download/$archive" "$location/${patch#www/}/$archive"); done
      /usr/bin/time -f "%e %M" -o "time.$name" curl -sf "${arguments[@]}"
      for archive in "${archives[@]}"; do
        cmp -s "download/$archive" "$patch/$archive" || { echo "update bench: curl fetched $archive wrong" >&2; exit 1; }
      done
      ;;
    apply)
      /usr/bin/time -f "%e %M" -o "time.$name" "$tool" apply "$patch" install >/dev/null
      check_installation apply
      ;;
    update)
      local code=0
      printf 'y\nn\n' | /usr/bin/time -f "%e %M" -o "time.$name" "$program" >update.out 2>&1 || code=$?
      # The program ends with 1 whatever the outcome; the version tells.
      [ "$code" = 1 ] || { echo "update bench: the updater ended with $code:" >&2; cat update.out >&2; exit 1; }
      grep -q '<CurrentVersion>2</CurrentVersion>' install/InstallationData.xml ||
        { echo "update bench: the updater did not reach version 2" >&2; exit 1; }
      check_installation update
      ;;
  esac
  tail -1 "time.$name" >>"$name.times"  # time notes a non-zero end first
}

for ((i = 0; i < rounds; i++)); do
  for name in download apply update; do measure "$name"; done
done

median() { sort -n | awk '{v[NR] = $1} END {print (NR % 2) ? v[(NR + 1) / 2] : (v[NR / 2] + v[NR / 2 + 1]) / 2}'; }
peak() { cut -d' ' -f2 "$1.times" | sort -n | tail -1 | awk '{printf "%d MiB", $1 / 1024}'; }
download=$(cut -d' ' -f1 download.times | median)
apply=$(cut -d' ' -f1 apply.times | median)
update=$(cut -d' ' -f1 update.times | median)
echo "rounds:                          $rounds"
echo "download alone (curl):           median $download s"
echo "apply alone (ironvale-patch):    median $apply s, peak RSS $(peak apply)"
echo "update (IronvaleUpdater):        median $update s, peak RSS $(peak update)"
awk -v d="$download" -v a="$apply" -v u="$update" 'BEGIN {
  m = d > a ? d : a
  printf "ratio update / max(download, apply):                  %.2f\n", u / m
  printf "ratio without the version check'\''s three-second pause: %.2f (goal <= 1.15)\n", (u - 3) / m
}'
