#!/usr/bin/env bash
# Builds what is missing, makes a sample game of version 1 and 2 with the
# version file, the patch from 1 to 2 and the complete build of 2 (with the
# publisher's ironvale-patch), prints the patch description and checks the
# patch with the updater's own applier. Then updates an installation of
# version 1 with the program itself: the Windows program under Wine (its
# window on a virtual display, the questions answered by a helper, a
# screenshot of the window) when Wine is installed, the native build with
# answers on its input otherwise; prints the log of the run, the tree, the
# new version and UpdateHistory.log.
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
# public half, in a build folder of its own, and takes only a latest version
# and descriptions signed with it.
keys=$root/build/demo-keys
[ -f "$keys/private.pem" ] || "$tool" keygen --out "$keys" >/dev/null
under_wine=
if [ -x /usr/lib/wine/wine64 ] && command -v x86_64-w64-mingw32-g++-posix >/dev/null; then under_wine=1; fi
keyed=$root/build/demo-native
[ -z "$under_wine" ] || keyed=$root/build/demo-windows
echo "== building the updater with the demo's public key in $keyed"
cmake -S "$root" -B "$keyed" -G Ninja -DCMAKE_BUILD_TYPE=Release -DIRONVALE_TESTS=OFF \
  ${under_wine:+-DCMAKE_TOOLCHAIN_FILE="$root/cmake/mingw-w64.cmake"} -DIRONVALE_PUBLIC_KEY="$keys/public.pem" >/dev/null
cmake --build "$keyed" --target IronvaleUpdater -j2 >/dev/null

echo "== ironvale-patch publish-version, build (patch), build --complete, all signed with $keys/private.pem"
"$tool" publish-version --key "$keys/private.pem" --version 2 --expires-in 7 "$demo/server" >/dev/null
"$tool" build --from "$demo/v1" --from-version 1 --to "$demo/v2" --version 2 --out "$demo/server" \
  --max-archive-size 100000 --sign-key "$keys/private.pem"
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

# The real update: version 1 installed and registered, the program copied
# beside the server's files (its built-in locations are relative to its own
# folder), the questions answered: update Yes, start the game No.
install=$demo/install
cp -r "$demo/v1" "$install"
printf '<?xml version="1.0" ?>\n<InstallationData>\n    <CurrentVersion>1</CurrentVersion>\n    <PatcherVersion>3</PatcherVersion>\n</InstallationData>\n' \
  >"$install/InstallationData.xml"

if [ -n "$under_wine" ]; then
  echo "== building the player's helper (dialog_answer)"
  cmake --preset windows >/dev/null
  cmake --build --preset windows --target dialog_answer >/dev/null
  export WINEPREFIX=$root/build/windows/wineprefix WINEDEBUG=-all
  run=scripts/wine-run.sh
  cp "$keyed/IronvaleUpdater.exe" "$demo/server/"
  key='HKLM\Software\Halvard\Ironvale'
  "$run" reg add "$key" /v "Install Dir" /t REG_SZ /d "Z:${install//\//\\}\\" /reg:32 /f >/dev/null
  "$run" reg add "$key" /v Language /t REG_SZ /d English /reg:32 /f >/dev/null
  # Wine's desktop stays tied to the display it started on: a fresh one.
  { /usr/lib/wine/wineserver -k; /usr/lib/wine/wineserver -w; } 2>/dev/null || true
  Xvfb -displayfd 3 -screen 0 1024x768x24 -nolisten tcp -noreset 3>"$demo/display" >/dev/null 2>&1 &
  xvfb=$!
  trap '"$run" reg delete "$key" /reg:32 /f >/dev/null 2>&1; { /usr/lib/wine/wineserver -k; /usr/lib/wine/wineserver -w; } 2>/dev/null; kill $xvfb' EXIT
  for _ in $(seq 200); do [ -s "$demo/display" ] && break; sleep 0.05; done
  export DISPLAY=:$(head -1 "$demo/display")
  echo "== running IronvaleUpdater.exe (demo key built in) under Wine, beside its signed patches in $demo/server"
  "$run" "$demo/server/IronvaleUpdater.exe" -hostname demo.ironvale.test 2>/dev/null &
  updater=$!
  # The window is on screen while the version check runs (three seconds).
  sleep 2
  shot=$root/build/windows/window.png
  import -display "$DISPLAY" -window root -crop 532x481+246+143 +repage "$shot"
  answer=build/windows/tests/support/programs/dialog_answer.exe
  echo "== the update question"; "$run" "$answer" "Ironvale - Updater" 6 60000 | tr -d '\r'
  echo "== the last question"; "$run" "$answer" "Ironvale - Updater" 7 60000 | tr -d '\r'
  code=0
  wait "$updater" || code=$?
  log=$(find "$WINEPREFIX/drive_c/users" -name IronvaleUpdater.log | head -1)
else
  cp "$keyed/IronvaleUpdater" "$demo/server/"
  export TMPDIR=$demo/tmp IRONVALE_REGISTRY_ROOT=$demo/registry
  mkdir -p "$TMPDIR" "$IRONVALE_REGISTRY_ROOT/HKEY_LOCAL_MACHINE/SOFTWARE/Halvard/Ironvale" \
    "$IRONVALE_REGISTRY_ROOT/HKEY_LOCAL_MACHINE/SOFTWARE/Microsoft/DirectX"
  printf 'Install Dir\t%s\nLanguage\tEnglish\n' "$install" \
    >"$IRONVALE_REGISTRY_ROOT/HKEY_LOCAL_MACHINE/SOFTWARE/Halvard/Ironvale/.values"
  printf 'Version\t4.09.00.0904\n' >"$IRONVALE_REGISTRY_ROOT/HKEY_LOCAL_MACHINE/SOFTWARE/Microsoft/DirectX/.values"
  echo "== running IronvaleUpdater (demo key built in) beside its signed patches in $demo/server, answering y, n"
  code=0
  printf 'y\nn\n' | "$demo/server/IronvaleUpdater" -hostname demo.ironvale.test || code=$?
  log=$TMPDIR/IronvaleUpdater.log
fi
echo "== exit code: $code"
echo "== the run's lines of $log"
# The last run starts at the last separator line (one line before it is empty).
start=$(grep -n -- '-\{103\}' "$log" | tail -1 | cut -d: -f1)
tail -n +"$((start - 1))" "$log" | tr -d '\r'
echo "== the installation now ($install)"
(cd "$install" && find . -type f | sort)
echo "== installed version: $(sed -n 's:.*<CurrentVersion>\(.*\)</CurrentVersion>.*:\1:p' "$install/InstallationData.xml")"
echo "== UpdateHistory.log"
tr -d '\r' <"$install/UpdateHistory.log"
if "$tool" verify "$demo/server/build_2" "$demo/empty" "$demo/v2" >/dev/null && diff -r -q -x 'InstallationData.xml' \
   -x 'Uninstall.xml' -x UpdateHistory.log "$install" "$demo/v2" >/dev/null; then
  echo "== the installation equals version 2"
fi
[ -n "${shot:-}" ] && echo "== screenshot of the window: $shot"
exit 0
