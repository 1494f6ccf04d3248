#!/usr/bin/env bash
# LZMA unpacking against xz, in the same run:
#   ironvale-patch archive extract ARCHIVE MEMBER OUT   (the updater's decoder)
#   xz --format=lzma -dc STREAM > OUT                   (the same LZMA stream)
# for a 16 MiB and a 256 MiB member packed by `ironvale-patch archive pack`
# (SDK encoder, level 5: 16 MiB dictionary). Prints the medians, the ratio
# and the peak RSS of both tools. Targets: time at most 1.05x xz's; peak
# memory the same for both member sizes (buffers and dictionary only).
#   bench/lzma.sh ROOT BUILD_DIR [RUNS]
set -euo pipefail
# $1 is the source tree; everything here lives in the build folder.
build=$2
runs=${3:-7}
tool=$build/tools/ironvale-patch
work=$build/bench-lzma
mkdir -p "$work"
cd "$work"

# Input: the machine's own libraries, a mix of code and data much like a
# game's files; made once and kept between runs.
if [ ! -f data-256.bin ]; then
  echo "making 256 MiB of input from /usr/lib ..." >&2
  python3 - <<'PY'
import os
want = 256 << 20
paths = []
for folder, _, names in os.walk("/usr/lib"):
    paths += [os.path.join(folder, n) for n in names]
with open("data-256.bin", "wb") as out:
    for path in sorted(paths):
        if want == 0:
            break
        if os.path.islink(path) or not os.path.isfile(path) or os.path.getsize(path) < 65536:
            continue
        with open(path, "rb") as f:
            chunk = f.read(want)
        out.write(chunk)
        want -= len(chunk)
PY
  head -c $((16 << 20)) data-256.bin > data-16.bin
fi
for size in 16 256; do
  if [ ! -f member-$size.pak ]; then
    echo "packing the $size MiB member (SDK encoder, level 5) ..." >&2
    "$tool" archive pack member-$size.pak member.bin=data-$size.bin
    # The archive holds one member named member.bin (1 + 10 + 5 bytes of
    # header); what follows is the LZMA stream itself.
    tail -c +17 member-$size.pak > member-$size.lzma
  fi
done

peak_kib() {  # COMMAND... -> peak resident set in KiB
  /usr/bin/time -f %M "$@" 2>&1 >/dev/null | tail -1
}
# Runs both tools in turn (ours, xz, ours, xz, ...) so that whatever else
# the machine does weighs on both alike; prints both medians in seconds.
medians() {  # SIZE
  python3 - "$tool" "$1" "$runs" <<'PY'
import statistics, subprocess, sys, time
tool, size, runs = sys.argv[1], sys.argv[2], int(sys.argv[3])
ours = [tool, "archive", "extract", "member-%s.pak" % size, "member.bin", "out-ours.bin"]
def xz():
    with open("out-xz.bin", "wb") as out:
        subprocess.run(["xz", "--format=lzma", "-dc", "member-%s.lzma" % size], stdout=out, check=True)
times = {"ours": [], "xz": []}
for i in range(runs + 1):
    for name, run in (("ours", lambda: subprocess.run(ours, check=True)), ("xz", xz)):
        start = time.perf_counter()
        run()
        if i > 0:  # the first round only warms the caches
            times[name].append(time.perf_counter() - start)
print(statistics.median(times["ours"]), statistics.median(times["xz"]))
PY
}

printf '%-8s %10s %14s %12s %8s %16s %12s\n' member packed_MiB ironvale_med_s xz_median_s ratio ironvale_peak_KiB xz_peak_KiB
for size in 16 256; do
  read -r ours_s xz_s < <(medians $size)
  cmp -s out-ours.bin data-$size.bin || { echo "ironvale-patch produced wrong data" >&2; exit 1; }
  cmp -s out-xz.bin data-$size.bin || { echo "xz produced wrong data" >&2; exit 1; }
  ours_kib=$(peak_kib $tool archive extract member-$size.pak member.bin out-ours.bin)
  xz_kib=$(peak_kib sh -c "exec xz --format=lzma -dc member-$size.lzma > out-xz.bin")
  ratio=$(python3 -c "print('%.3f' % ($ours_s / $xz_s))")
  packed=$(python3 -c "import os; print('%.1f' % (os.path.getsize('member-$size.lzma') / 2**20))")
  printf '%-8s %10s %14.3f %12.3f %8s %16s %12s\n' "${size}MiB" "$packed" "$ours_s" "$xz_s" "$ratio" \
    "$ours_kib" "$xz_kib"
done
rm -f out-ours.bin out-xz.bin
echo "targets: ratio <= 1.05 (256 MiB); ironvale-patch peak RSS equal for 16 and 256 MiB"
