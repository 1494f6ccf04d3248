#!/usr/bin/env bash
# Download throughput: our downloader (ironvale-patch fetch) against
# `curl -o`, both fetching the same 512 MiB file from a loopback nginx in
# the same run. Prints the medians and the ratio (ours / curl, higher is
# better; the target is at least 0.9). When the Windows build is there, the
# WinINet figure under Wine is printed beside it.
#   bench/download.sh ROOT BUILD_DIR [RUNS]
set -euo pipefail
root=$1
build=$2
runs=${3:-5}
tool=$build/tools/ironvale-patch
wintool=$root/build/windows/tools/ironvale-patch.exe
size_mib=512

for needed in nginx curl hyperfine python3; do
  command -v "$needed" >/dev/null || { echo "download bench: $needed is missing" >&2; exit 2; }
done
[ -x "$tool" ] || { echo "download bench: $tool not built" >&2; exit 2; }

source "$root/bench/support/scratch.sh"
make_scratch download

mkdir -p "$work/www" "$work/out"
head -c $((size_mib * 1024 * 1024)) /dev/urandom >"$work/www/big.bin"
source "$root/bench/support/loopback_nginx.sh"
start_nginx "$work" big.bin
url="http://127.0.0.1:$port/big.bin"

# Both results must be the file itself, or the timing means nothing.
"$tool" fetch "$url" "$work/out/check.bin"
cmp -s "$work/www/big.bin" "$work/out/check.bin" || { echo "download bench: fetched file differs" >&2; exit 1; }
rm -f "$work/out/check.bin"

commands=(-n curl "curl -s -o $work/out/curl.bin $url" -n ironvale "$tool fetch $url $work/out/ours.bin")
hyperfine --style none --warmup 1 --runs "$runs" --export-json "$work/native.json" "${commands[@]}" >/dev/null

wine_json=
if [ -f "$wintool" ]; then
  "$root/scripts/wine-run.sh" "$wintool" fetch "$url" "Z:$work/out/wine.bin"
  cmp -s "$work/www/big.bin" "$work/out/wine.bin" || { echo "download bench: WinINet file differs" >&2; exit 1; }
  hyperfine --style none --warmup 1 --runs "$runs" --export-json "$work/wine.json" \
    -n wininet "$root/scripts/wine-run.sh $wintool fetch $url Z:$work/out/wine.bin" >/dev/null
  wine_json=$work/wine.json
fi

python3 "$root/bench/support/throughput.py" "$size_mib" "download of $size_mib MiB from a loopback nginx" \
  "$work/native.json" "curl=curl -o" "ironvale=ironvale (libcurl)" \
  "$wine_json" "wininet=ironvale (WinINet, Wine)" 0.90x
