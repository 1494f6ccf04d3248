#!/usr/bin/env bash
# Builds what is missing, makes a sample game of version 1 and 2 with the
# version file, the patch from 1 to 2 and the complete build of 2 (with the
# publisher's ironvale-patch), prints the patch description and checks the
# patch with the updater's own applier. Then runs the updater once with a
# sample command line: the Windows program under Wine when Wine is
# installed, the native build otherwise, and prints the log the run wrote.
# Under Wine it also shows the updater's window with some progress on a
# private X display and saves a screenshot of it in the build folder.
set -euo pipefail
root=$(cd "$(dirname "$0")/.." && pwd)
cd "$root"
bash scripts/setup.sh >/dev/null  # installs only what is missing

echo "== building the publisher's tool"
cmake --preset native >/dev/null
cmake --build --preset native --target ironvale-patch -j2 >/dev/null
tool=$root/build/native/tools/ironvale-patch

demo=$root/build/demo
echo "== making a sample game of version 1 and 2 in $demo"
rm -rf "$demo"
mkdir -p "$demo/v1/data/levels" "$demo/v1/data/old_voices" "$demo/v1/docs"
head -c 200000 /dev/urandom >"$demo/v1/Ironvale.exe"
for i in 1 2 3; do seq 1 4000 | sed "s/^/level $i row /" >"$demo/v1/data/levels/level$i.map"; done
echo "hello" >"$demo/v1/data/old_voices/hello.ogg"
echo "Ironvale version 1" >"$demo/v1/docs/readme.txt"
echo "removed in 2" >"$demo/v1/docs/changes_1.txt"
cp -r "$demo/v1" "$demo/v2"
# Version 2: an edited program and level, a new level in a new folder, a
# new empty folder, a removed file and a removed folder.
printf 'patched bytes' | dd of="$demo/v2/Ironvale.exe" bs=1 seek=1000 conv=notrunc 2>/dev/null
sed -i 's/level 2 row 17$/level 2 row 17 (fixed)/' "$demo/v2/data/levels/level2.map"
mkdir -p "$demo/v2/data/levels/north" "$demo/v2/saves"
seq 1 3000 | sed 's/^/north row /' >"$demo/v2/data/levels/north/level4.map"
echo "Ironvale version 2" >"$demo/v2/docs/readme.txt"
rm -r "$demo/v2/data/old_voices" "$demo/v2/docs/changes_1.txt"

# A throw-away signing key, made on the first demo and kept beside the
# builds (never in the repository). The program run below is built with its
# public half and takes only descriptions signed with it.
keys=$root/build/demo-keys
[ -f "$keys/private.pem" ] || "$tool" keygen --out "$keys" >/dev/null
cmake --preset native -DIRONVALE_PUBLIC_KEY="$keys/public.pem" >/dev/null
if [ -x /usr/lib/wine/wine64 ] && command -v x86_64-w64-mingw32-g++-posix >/dev/null; then
  cmake --preset windows -DIRONVALE_PUBLIC_KEY="$keys/public.pem" >/dev/null
fi

echo "== ironvale-patch version, build (patch), build --complete, both signed with $keys/private.pem"
"$tool" version --out "$demo/server" 2
"$tool" build --from "$demo/v1" --to "$demo/v2" --version 2 --out "$demo/server" --max-archive-size 100000 \
  --sign-key "$keys/private.pem"
"$tool" build --complete --to "$demo/v2" --version 2 --out "$demo/server" --sign-key "$keys/private.pem"
echo "== $demo/server"
(cd "$demo/server" && find . -type f | sort | xargs ls -l | awk '{print $5, $9}')
echo "== patch_515195_2/patchinfo.xml"
cat "$demo/server/patch_515195_2/patchinfo.xml"
echo "== ironvale-patch check (signature and archives, as the updater checks them)"
"$tool" check "$demo/server/patch_515195_2" --public-key "$keys/public.pem"
echo "== ironvale-patch verify (the patch on version 1, the complete build on an empty folder)"
mkdir -p "$demo/empty"
"$tool" verify "$demo/server/patch_515195_2" "$demo/v1" "$demo/v2"
"$tool" verify "$demo/server/build_2" "$demo/empty" "$demo/v2"

sample=(-latestVersion 2 -hostname demo.ironvale.test -serverDeltaTime 5)

if [ -x /usr/lib/wine/wine64 ] && command -v x86_64-w64-mingw32-g++-posix >/dev/null; then
  echo "== building the Windows program"
  cmake --preset windows >/dev/null
  cmake --build --preset windows --target IronvaleUpdater window_driver >/dev/null
  export WINEPREFIX=$root/build/windows/wineprefix
  under_wine=1
  echo "== running IronvaleUpdater.exe ${sample[*]} under Wine"
  set +e
  scripts/wine-run.sh build/windows/IronvaleUpdater.exe "${sample[@]}"
  code=$?
  set -e
  log=$(find "$WINEPREFIX/drive_c/users" -name IronvaleUpdater.log | head -1)
else
  echo "== building the native program"
  cmake --preset native >/dev/null
  cmake --build --preset native --target IronvaleUpdater >/dev/null
  export TMPDIR=$root/build/native/demo-tmp
  mkdir -p "$TMPDIR"
  echo "== running IronvaleUpdater ${sample[*]}"
  set +e
  build/native/IronvaleUpdater "${sample[@]}" </dev/null
  code=$?
  set -e
  log=$TMPDIR/IronvaleUpdater.log
fi
echo "== exit code: $code"
echo "== the run's lines of $log"
# The last run starts at the last separator line (one line before it is empty).
start=$(grep -n -- '-\{103\}' "$log" | tail -1 | cut -d: -f1)
tail -n +"$((start - 1))" "$log" | tr -d '\r'

if [ -n "${under_wine:-}" ]; then
  echo "== the updater's window under Wine, at 60 % of a run"
  shot=$root/build/windows/window.png
  Xvfb -displayfd 3 -screen 0 1024x768x24 -nolisten tcp 3>"$demo/display" >/dev/null 2>&1 &
  xvfb=$!
  for _ in $(seq 200); do [ -s "$demo/display" ] && break; sleep 0.05; done
  export DISPLAY=:$(head -1 "$demo/display")
  coproc DRIVER { scripts/wine-run.sh build/windows/tests/window_driver.exe 2>/dev/null; }
  for command in start "status File: data/levels/level2.map" "overall 600" "file 600" rect; do
    echo "$command" >&"${DRIVER[1]}"
    read -r -t 60 reply <&"${DRIVER[0]}"
  done
  read -r _ left top right bottom <<<"${reply%$'\r'}"
  sleep 1  # the window repaints on its own thread
  import -display "$DISPLAY" -window root -crop "$((right - left))x$((bottom - top))+$left+$top" +repage "$shot"
  echo stop >&"${DRIVER[1]}"
  exec {DRIVER[1]}>&-
  wait "$DRIVER_PID" 2>/dev/null || true
  kill "$xvfb"
  echo "== screenshot: $shot"
fi
