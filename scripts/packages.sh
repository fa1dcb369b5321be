#!/usr/bin/env bash
# Builds the Debian packages: scripts/packages.sh [ARCHITECTURE [FOLDER]], by default of this machine's architecture and
# into build/packages/ARCHITECTURE. Another architecture (armhf, armel) is built with Debian's cross compiler.
set -euo pipefail
cd "$(dirname "$0")/.."
. scripts/need.sh
need "${build_packages[@]}" dpkg-dev debhelper

own=$(dpkg --print-architecture)
architecture=${1:-$own} folder=${2:-build/packages/${1:-$own}}
[ "$architecture" != "$own" ] || need "${plugin_packages[@]}"
[ "$architecture" = "$own" ] || need "g++-$(dpkg-architecture -a "$architecture" -qDEB_HOST_MULTIARCH 2>/dev/null)"

# Built in a copy, so that nothing is left among the sources.
rm -rf "$folder"
mkdir -p "$folder/source"
tar -c --exclude=./.git --exclude=./build --exclude='./build-*' . | tar -x -C "$folder/source"
cd "$folder/source"
# Nobody gets what would be built for debuggers.
DEB_CXXFLAGS_STRIP=-g DEB_BUILD_OPTIONS="nocheck noautodbgsym terse parallel=$(nproc)" dpkg-buildpackage \
  --host-arch "$architecture" --build=binary --unsigned-changes --no-check-builddeps --build-profiles=nocheck
cd ..
rm -rf source
ls -- *.deb
