# Sourced by the benchmarks that run the whole updater on a generated game.
#   build_updater LOCATION NAME  the native IronvaleUpdater with LOCATION built
#                                in, kept as NAME beside it; sets program
#   use_registry INSTALL         the program finds the game in INSTALL (its
#                                registry and temporary folder in $work)
#   reset_installation FROM INSTALL  a copy of FROM installed as version 1
build_updater() {
  local dir=$root/build/bench-updater
  cmake -S "$root" -B "$dir" -G Ninja -DCMAKE_BUILD_TYPE=Release -DIRONVALE_TESTS=OFF \
    -DIRONVALE_UPDATE_LOCATION="$1" >/dev/null
  cmake --build "$dir" --target IronvaleUpdater >/dev/null
  program=$dir/$2
  [ "$2" = IronvaleUpdater ] || cp "$dir/IronvaleUpdater" "$program"
}

use_registry() {
  export IRONVALE_REGISTRY_ROOT=$work/registry TMPDIR=$work/tmp
  local game=$IRONVALE_REGISTRY_ROOT/HKEY_LOCAL_MACHINE/SOFTWARE/Halvard/Ironvale
  local directx=$IRONVALE_REGISTRY_ROOT/HKEY_LOCAL_MACHINE/SOFTWARE/Microsoft/DirectX
  mkdir -p "$TMPDIR" "$game" "$directx"
  printf 'Install Dir\t%s\nLanguage\tEnglish\n' "$1" >"$game/.values"
  printf 'Version\t4.09.00.0904\n' >"$directx/.values"
}

reset_installation() {
  rm -rf "$2" "${TMPDIR:?}"/*
  cp -a "$1" "$2"
  printf '<?xml version="1.0" ?>\n<InstallationData>\n    <CurrentVersion>1</CurrentVersion>\n    <PatcherVersion>3</PatcherVersion>\n</InstallationData>\n' \
    >"$2/InstallationData.xml"
}
