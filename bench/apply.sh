#!/usr/bin/env bash
# Both patch stages against a plain pipeline doing the same work, in the
# same run: a generated installation (SIZE_MIB, default 1024, in FILES
# files, default 300) and a patch in 8 archives rebuilding 20% of them
# from xdelta3 deltas (about 5% of each changed file edited). Ours:
# ironvale-patch apply (archives copied by the downloader from file://
# locations, deltas unpacked and decoded, files moved in), with stage one
# on one worker and on the default (the cores). The pipeline, per changed
# file: xz --format=lzma -dc | xdelta3 -d, then mv. Prints the medians,
# the ratios (default / one worker: at most 0.6 on two cores is the goal;
# ours / pipeline: at most 1.0) and each peak RSS.
#   bench/apply.sh ROOT BUILD_DIR   (ROUNDS=N default 5, SIZE_MIB, FILES)
set -euo pipefail
root=$1
build=$2
rounds=${ROUNDS:-5}
size_mib=${SIZE_MIB:-1024}
files=${FILES:-300}
tool=$build/tools/ironvale-patch
work=$build/bench-apply-$size_mib-$files
mkdir -p "$work"
cd "$work"

if [ ! -f patch/patchinfo.xml ]; then
  echo "making the installation, the target and the patch (once per build folder and size)"
  rm -rf pristine target deltas patch lzma
  mkdir -p pristine target deltas patch lzma
  python3 - "$root/tests/patch" "$size_mib" "$files" <<'PY'
import os, random, sys
sys.path.insert(0, sys.argv[1])
from make_xdelta3_cases import edit
size, count = int(sys.argv[2]) << 20, int(sys.argv[3])
rng = random.Random(1024)
changed = []
for i in range(count):
    name = "data%02d/file%04d.bin" % (i % 16, i)
    os.makedirs(os.path.dirname("pristine/" + name), exist_ok=True)
    os.makedirs(os.path.dirname("target/" + name), exist_ok=True)
    # Sizes vary around the mean (half to one and a half times it).
    length = int(size / count * (0.5 + rng.random()))
    data = rng.randbytes(length)
    open("pristine/" + name, "wb").write(data)
    if i % 5 == 0:
        # About 5% of the bytes edited, in runs of up to 128.
        data = edit(rng, data, max(1, length // 1300), 128)
        changed.append(name)
    open("target/" + name, "wb").write(data)
open("changed.txt", "w").write("\n".join(changed) + "\n")
PY
  i=0
  items=""
  pack_args=()
  while read -r name; do
    flat=${name//\//_}
    xdelta3 -e -f -A -S none -s "pristine/$name" "target/$name" "deltas/$flat"
    xz --format=lzma -k -c "deltas/$flat" >"lzma/$flat.lzma"
    archive="archive$((i % 8)).dat"
    items+="        <diff Path=\"${name//\//\\}\" File=\"$archive\" />"$'\n'
    echo "${name//\//\\}=deltas/$flat" >>"members.$archive"
    i=$((i + 1))
  done <changed.txt
  for list in members.*; do
    mapfile -t members <"$list"
    "$tool" archive pack "patch/${list#members.}" "${members[@]}"
  done
  printf '<?xml version="1.0" ?>\n<IronvaleWestPatch>\n    <FileChanges>\n%s    </FileChanges>\n</IronvaleWestPatch>\n' \
    "$items" >patch/patchinfo.xml
fi
du -sh pristine patch lzma | awk '{print "  " $1 "\t" $2}'
echo "  $(wc -l <changed.txt) of $files files changed"

reset_installation() {  # a fresh copy of the old installation
  rm -rf install pipeline-out
  cp -a pristine install
}

run_pipeline() {
  mkdir -p pipeline-out
  while read -r name; do
    flat=${name//\//_}
    xz --format=lzma -dc "lzma/$flat.lzma" >pipeline-out/delta
    xdelta3 -d -f -s "install/$name" pipeline-out/delta "pipeline-out/$flat"
  done <changed.txt
  while read -r name; do
    mv "pipeline-out/${name//\//_}" "install/$name"
  done <changed.txt
  rm -rf pipeline-out
}

check_installation() {
  while read -r name; do cmp -s "install/$name" "target/$name" || { echo "apply.sh: $1 left $name wrong" >&2; exit 1; }; done <changed.txt
}

measure() {  # NAME: appends "seconds kilobytes" to NAME.times
  local name=$1
  reset_installation
  sync
  if [ "$name" = ours ]; then
    /usr/bin/time -f "%e %M" -o "time.$name" "$tool" apply patch install
  elif [ "$name" = one ]; then
    /usr/bin/time -f "%e %M" -o "time.$name" "$tool" apply --workers 1 patch install
  else
    /usr/bin/time -f "%e %M" -o "time.$name" bash -c "$(declare -f run_pipeline); run_pipeline"
  fi
  cat "time.$name" >>"$name.times"
  check_installation "$name"
}

rm -f ours.times one.times pipeline.times
for ((i = 0; i < rounds; i++)); do
  if ((i % 2 == 0)); then
    measure ours
    measure one
    measure pipeline
  else
    measure pipeline
    measure one
    measure ours
  fi
done
rm -rf install

median() { sort -n | awk '{v[NR] = $1} END {print (NR % 2) ? v[(NR + 1) / 2] : (v[NR / 2] + v[NR / 2 + 1]) / 2}'; }
ours=$(cut -d' ' -f1 ours.times | median)
theirs=$(cut -d' ' -f1 pipeline.times | median)
one=$(cut -d' ' -f1 one.times | median)
ours_kb=$(cut -d' ' -f2 ours.times | sort -n | tail -1)
one_kb=$(cut -d' ' -f2 one.times | sort -n | tail -1)
echo "rounds:                    $rounds"
echo "ironvale-patch apply:      median ${ours} s, peak RSS $((ours_kb / 1024)) MiB ($(nproc) workers at most)"
echo "  --workers 1:             median ${one} s, peak RSS $((one_kb / 1024)) MiB"
echo "xz -dc | xdelta3 -d; mv:   median ${theirs} s"
awk -v a="$ours" -v b="$one" 'BEGIN {printf "ratio (default / one):     %.2f\n", a / b}'
awk -v a="$ours" -v b="$theirs" 'BEGIN {printf "ratio (ours / pipeline):   %.2f\n", a / b}'
