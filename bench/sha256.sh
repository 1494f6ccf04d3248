#!/usr/bin/env bash
# What checking archives costs: the SHA-256 of a 1 GiB patch archive
# through the updater's own code (ironvale-patch check: OpenSSL natively)
# against sha256sum over the same file, in the same run. Prints both
# medians, the throughputs and the ratio (ours / sha256sum, higher is
# better). When the Windows build is there, the CNG figure under Wine is
# printed beside it (Wine's CNG, not Windows': indicative only).
#   bench/sha256.sh ROOT BUILD_DIR [RUNS]   (SIZE_MIB, default 1024)
set -euo pipefail
root=$1
build=$2
runs=${3:-5}
size_mib=${SIZE_MIB:-1024}
tool=$build/tools/ironvale-patch
wintool=$root/build/windows/tools/ironvale-patch.exe

for needed in sha256sum hyperfine python3; do
  command -v "$needed" >/dev/null || { echo "sha256 bench: $needed is missing" >&2; exit 2; }
done
[ -x "$tool" ] || { echo "sha256 bench: $tool not built" >&2; exit 2; }

source "$root/bench/support/scratch.sh"
make_scratch sha256

# A patch of one archive, its description declaring what sha256sum says.
mkdir -p "$work/patch"
archive=$work/patch/patch0.lzma
head -c $((size_mib * 1024 * 1024)) /dev/urandom >"$archive"
digest=$(sha256sum "$archive" | cut -d' ' -f1)
cat >"$work/patch/patchinfo.xml" <<XML
<?xml version="1.0" ?>
<IronvaleWestPatch>
    <FileChanges>
        <new Path="data.bin" File="patch0.lzma" />
    </FileChanges>
    <Version>2</Version>
    <Archives>
        <archive File="patch0.lzma" Size="$((size_mib * 1024 * 1024))" Sha256="$digest" />
    </Archives>
</IronvaleWestPatch>
XML
# Both must agree, or the timing means nothing.
"$tool" check "$work/patch" >/dev/null || { echo "sha256 bench: ironvale-patch check disagrees with sha256sum" >&2; exit 1; }

hyperfine --style none --warmup 1 --runs "$runs" --export-json "$work/native.json" \
  -n sha256sum "sha256sum $archive" -n ironvale "$tool check $work/patch" >/dev/null

wine_json=
if [ -f "$wintool" ]; then
  "$root/scripts/wine-run.sh" "$wintool" check "Z:$work/patch" >/dev/null ||
    { echo "sha256 bench: CNG under Wine disagrees with sha256sum" >&2; exit 1; }
  hyperfine --style none --runs 3 --export-json "$work/wine.json" \
    -n cng "$root/scripts/wine-run.sh $wintool check Z:$work/patch" >/dev/null
  wine_json=$work/wine.json
fi

python3 "$root/bench/support/throughput.py" "$size_mib" "SHA-256 of a $size_mib MiB patch archive" \
  "$work/native.json" "sha256sum=sha256sum" "ironvale=ironvale check (OpenSSL)" \
  "$wine_json" "cng=ironvale check (CNG, Wine)"
