#!/usr/bin/env bash
# Downloads that survive, measured against the patch itself: a patch of
# ARCHIVES (default 9) archives of 32 MiB of random bytes, served by a
# loopback nginx at RATE bytes per second (default 50m, a fast home line)
# that logs the bytes it sends.
#   killed: the native IronvaleUpdater killed (SIGKILL) at KILLS (default 10)
#           seeded moments of its downloads, each time started again, then
#           run to the end. Prints the archive bytes served in all against
#           the patch, and the bytes sent again per kill (goal: at most 1 MiB).
#   cut:    the same patch through a proxy that drops the connection each time
#           another 50 MiB have passed: the run must end updated, without a
#           question. Prints the drops, the retries and the bytes served.
#   bench/resume.sh ROOT BUILD_DIR   (ARCHIVES, KILLS, SEED, RATE)
set -euo pipefail
root=$1
archives=${ARCHIVES:-9}
kills=${KILLS:-10}
seed=${SEED:-23}
rate=${RATE:-50m}
cut_every=$((50 << 20))

for needed in nginx curl python3 xz sha256sum; do
  command -v "$needed" >/dev/null || { echo "resume bench: $needed is missing" >&2; exit 2; }
done

source "$root/bench/support/scratch.sh"
make_scratch resume
cd "$work"

# One 32 MiB block of random bytes, packed once (xz's LZMA, fast on bytes it
# cannot compress) and sent as every archive's member under its own name.
echo "making the patch: $archives archives of 32 MiB"
patch=www/patch_515195_2
mkdir -p "$patch" v1 cut
head -c $((32 << 20)) /dev/urandom >block.bin
xz --format=lzma -0 -T1 -c block.bin >block.lzma
echo "game" >v1/IronvaleGame.exe
{
  printf '<?xml version="1.0" ?>\n<IronvaleWestPatch>\n    <FileChanges>\n'
  for ((i = 0; i < archives; i++)); do printf '        <new Path="file%d.bin" File="patch%d.lzma" />\n' "$i" "$i"; done
  printf '    </FileChanges>\n    <DirectoryChanges />\n    <RegistryHive>HKEY_LOCAL_MACHINE</RegistryHive>\n'
  printf '    <RegistryPath>SOFTWARE\\Halvard\\Ironvale</RegistryPath>\n    <Version>2</Version>\n    <Archives>\n'
  for ((i = 0; i < archives; i++)); do
    archive=$patch/patch$i.lzma
    name=file$i.bin
    python3 -c 'import sys; sys.stdout.buffer.write(bytes([len(sys.argv[1])]) + sys.argv[1].encode() +
                int(sys.argv[2]).to_bytes(5, "little"))' "$name" "$(stat -c %s block.lzma)" >"$archive"
    cat block.lzma >>"$archive"
    printf '        <archive File="patch%d.lzma" Size="%d" Sha256="%s" />\n' "$i" "$(stat -c %s "$archive")" \
      "$(sha256sum "$archive" | cut -d' ' -f1)"
  done
  printf '    </Archives>\n</IronvaleWestPatch>\n'
} >"$patch/patchinfo.xml"
total=$(cat "$patch"/*.lzma | wc -c)

source "$root/bench/support/loopback_nginx.sh"
nginx_extra="log_format sent '\$status \$body_bytes_sent \$uri'; access_log $work/access.log sent; limit_rate $rate;"
start_nginx "$work" "${patch#www/}/patchinfo.xml"
proxy_port=$(python3 -c 'import socket; s = socket.socket(); s.bind(("127.0.0.1", 0)); print(s.getsockname()[1])')
python3 "$root/bench/support/cutting_proxy.py" "$proxy_port" "$port" "$cut_every" "$work/drops" &
proxy_pid=$!
trap 'kill $proxy_pid 2>/dev/null; remove_scratch' EXIT

source "$root/bench/support/installed_game.sh"
build_updater "http://127.0.0.1:$proxy_port" updater-cut
cut_program=$program
build_updater "http://127.0.0.1:$port" updater-direct
use_registry "$work/install"

served() {  # the archive bytes nginx sent since the log was last emptied
  awk '$3 ~ /\.lzma$/ {s += $2} END {print s + 0}' access.log
}
updated() {  # NAME: the run's outcome, the installation byte for byte
  grep -q '<CurrentVersion>2</CurrentVersion>' install/InstallationData.xml ||
    { echo "resume bench: the $1 run did not reach version 2" >&2; exit 1; }
  for ((i = 0; i < archives; i++)); do
    cmp -s block.bin "install/file$i.bin" || { echo "resume bench: the $1 run left file$i.bin wrong" >&2; exit 1; }
  done
}
mib() { awk -v b="$1" 'BEGIN {printf "%.1f MiB", b / 1048576}'; }

echo "killed $kills times during the downloads (seed $seed), at $rate bytes/s:"
reset_installation v1 install
: >access.log
code=0
python3 "$root/bench/support/kill_during_download.py" "$program" install/tempPatch "$total" "$kills" "$seed" || code=$?
[ "$code" = 1 ] || { echo "resume bench: the last run ended with $code" >&2; exit 1; }
updated killed
killed_served=$(served)

echo "dropped every 50 MiB by a proxy:"
reset_installation v1 install
: >access.log
code=0
printf 'y\nn\n' | "$cut_program" -latestVersion 2 >cut/output 2>&1 || code=$?
[ "$code" = 1 ] || { echo "resume bench: the cut run ended with $code" >&2; exit 1; }
! grep -q "could not be downloaded" cut/output || { echo "resume bench: the cut run asked a question" >&2; exit 1; }
updated cut
cut_served=$(served)
retries=$(grep -c "broke off; trying again" "$TMPDIR/IronvaleUpdater.log" || true)

echo "patch:                      $archives archives, $(mib "$total")"
awk -v s="$killed_served" -v t="$total" -v k="$kills" 'BEGIN {
  printf "killed %d times, served:    %.1f MiB in all, %.3f x the patch\n", k, s / 1048576, s / t
  printf "sent again per kill:        %.2f MiB (goal <= 1 MiB)\n", (s - t) / k / 1048576
}'
awk -v s="$cut_served" -v t="$total" -v d="$(wc -l <drops)" -v r="$retries" 'BEGIN {
  printf "dropped every 50 MiB:       %d drops, %d retries, no question; served %.1f MiB, %.3f x the patch\n",
    d, r, s / 1048576, s / t
}'
