#!/usr/bin/env bash
# Installs everything the two builds and the test suite need on a fresh
# Debian 12 machine. Safe to run again: it only adds what is missing, and
# when nothing is, it needs no rights and changes nothing. Installing needs
# root (apt-get, /etc/apt, the deps folder); run as root or with sudo
# available. IRONVALE_DEPS_DIR (default /opt/ironvale-deps) is where
# Debian's TinyXML source is unpacked for the Windows build; CMake reads
# the same variable.
set -euo pipefail
deps_dir=${IRONVALE_DEPS_DIR:-/opt/ironvale-deps}

as_root() {
  if [ "$(id -u)" -eq 0 ]; then
    "$@"
  elif command -v sudo >/dev/null; then
    sudo "$@"
  else
    echo "setup: '$*' needs root; run scripts/setup.sh as root" >&2
    exit 1
  fi
}

packages=(
  build-essential cmake ninja-build pkg-config git
  g++-mingw-w64-x86-64-posix gcc-mingw-w64-x86-64-posix binutils-mingw-w64-x86-64
  mingw-w64-x86-64-dev libz-mingw-w64-dev
  wine64 xvfb
  fonts-dejavu-core fonts-ipafont-gothic imagemagick python3-pil xdotool
  libtinyxml-dev lzma-dev zlib1g-dev libcurl4-openssl-dev libssl-dev
  googletest libgtest-dev libgmock-dev libbenchmark-dev
  clang libclang-rt-14-dev clang-format
  xdelta3 xz-utils python3 nginx curl hyperfine time openssl
  dpkg-dev
)

missing=()
for p in "${packages[@]}"; do
  dpkg-query -W -f='${Status}' "$p" 2>/dev/null | grep -q 'install ok installed' || missing+=("$p")
done

# Debian's TinyXML source is built into the Windows program; apt needs a
# deb-src entry to hand it out.
need_source=
[ -f "$deps_dir/tinyxml/tinyxml.h" ] || need_source=1
if [ -n "$need_source" ] && ! grep -rqs '^Types:.*deb-src' /etc/apt/sources.list.d/ &&
   ! grep -qs '^deb-src' /etc/apt/sources.list; then
  echo "setup: adding deb-src entries"
  as_root tee /etc/apt/sources.list.d/ironvale-src.sources >/dev/null <<'SRC'
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
  as_root env DEBIAN_FRONTEND=noninteractive apt-get update -qq
fi
if [ ${#missing[@]} -gt 0 ]; then
  echo "setup: installing ${missing[*]}"
  as_root env DEBIAN_FRONTEND=noninteractive apt-get install -y -qq --no-install-recommends "${missing[@]}"
fi

# TinyXML source for the Windows build, unpacked with Debian's patches
# applied, outside the repository.
if [ -n "$need_source" ]; then
  echo "setup: fetching Debian's tinyxml source into $deps_dir"
  tmp=$(mktemp -d)
  (cd "$tmp" && apt-get source -qq --download-only tinyxml 2>/dev/null && dpkg-source -x ./*.dsc src >/dev/null)
  as_root mkdir -p "$deps_dir"
  as_root rm -rf "$deps_dir/tinyxml"
  as_root mv "$tmp/src" "$deps_dir/tinyxml"
  rm -rf "$tmp"
fi
echo "setup: done"
