#!/usr/bin/env bash
# Installs everything the two builds and the test suite need on a fresh
# Debian 12 machine. Safe to run again: it only adds what is missing.
set -euo pipefail
here=$(cd "$(dirname "$0")/.." && pwd)
deps_dir=${IRONVALE_DEPS_DIR:-/opt/ironvale-deps}

packages=(
  build-essential cmake ninja-build pkg-config git
  g++-mingw-w64-x86-64-posix gcc-mingw-w64-x86-64-posix binutils-mingw-w64-x86-64
  mingw-w64-x86-64-dev libz-mingw-w64-dev
  wine64 xvfb
  libtinyxml-dev lzma-dev zlib1g-dev libcurl4-openssl-dev libssl-dev
  googletest libgtest-dev libgmock-dev libbenchmark-dev
  clang libclang-rt-14-dev clang-format
  xdelta3 xz-utils python3 nginx curl hyperfine time
  dpkg-dev
)

missing=()
for p in "${packages[@]}"; do
  dpkg-query -W -f='${Status}' "$p" 2>/dev/null | grep -q 'install ok installed' || missing+=("$p")
done

# Debian's TinyXML source is built into the Windows program; apt needs a
# deb-src entry to hand it out.
if ! grep -rqs '^Types:.*deb-src' /etc/apt/sources.list.d/ && ! grep -qs '^deb-src' /etc/apt/sources.list; then
  echo "setup: adding deb-src entries"
  cat > /etc/apt/sources.list.d/ironvale-src.sources <<'SRC'
Types: deb-src
URIs: http://deb.debian.org/debian
Suites: bookworm bookworm-updates
Components: main
Signed-By: /usr/share/keyrings/debian-archive-keyring.gpg

Types: deb-src
URIs: http://deb.debian.org/debian-security
Suites: bookworm-security
Components: main
Signed-By: /usr/share/keyrings/debian-archive-keyring.gpg
SRC
  need_update=1
fi

if [ ${#missing[@]} -gt 0 ] || [ -n "${need_update:-}" ]; then
  export DEBIAN_FRONTEND=noninteractive
  apt-get update -qq
fi
if [ ${#missing[@]} -gt 0 ]; then
  echo "setup: installing ${missing[*]}"
  DEBIAN_FRONTEND=noninteractive apt-get install -y -qq --no-install-recommends "${missing[@]}"
fi

# TinyXML source for the Windows build, unpacked with Debian's patches
# applied, outside the repository.
mkdir -p "$deps_dir"
if [ ! -f "$deps_dir/tinyxml/tinyxml.h" ]; then
  echo "setup: fetching Debian's tinyxml source"
  tmp=$(mktemp -d)
  (cd "$tmp" && apt-get source -qq --download-only tinyxml 2>/dev/null && dpkg-source -x ./*.dsc src >/dev/null)
  rm -rf "$deps_dir/tinyxml"
  mv "$tmp/src" "$deps_dir/tinyxml"
  rm -rf "$tmp"
fi
echo "setup: done"
