#!/usr/bin/env bash
# Builds and runs the tests: scripts/test.sh [LEG...]. Installs what a leg needs.
#   native (default)   this machine, g++, Release        asan    address and undefined behaviour sanitizers
#   clang              this machine, clang++, Release    tsan    thread sanitizer
#   armhf, armel       32-bit ARM under the emulator     armhf-clang   32-bit ARM with clang
#   all                native asan tsan armhf armel
set -euo pipefail
cd "$(dirname "$0")/.."
. scripts/need.sh

packages_of() {
  case $1 in
    clang) echo clang ;;
    armhf) echo qemu-user g++-arm-linux-gnueabihf googletest ;;
    armel) echo qemu-user g++-arm-linux-gnueabi googletest ;;
    armhf-clang) echo clang qemu-user g++-arm-linux-gnueabihf googletest ;;
  esac
}

run_leg() {
  local preset=$1
  [ "$preset" = native ] && preset=release
  need "${build_packages[@]}" strace pkg-config $(packages_of "$1")
  echo "== $1: building (build/$preset)"
  local strict=OFF
  [ "${CI:-}" = true ] && strict=ON
  cmake --preset "$preset" -DCMAKE_COMPILE_WARNING_AS_ERROR=$strict >/dev/null
  cmake --build --preset "$preset" --parallel "$(nproc)"
  echo "== $1: testing"
  ctest --preset "$preset" --parallel "$(nproc)"
}

[ $# -gt 0 ] || set -- native
[ "$1" = all ] && set -- native asan tsan armhf armel
for leg in "$@"; do
  case $leg in
    native | clang | asan | tsan | armhf | armel | armhf-clang) run_leg "$leg" ;;
    *) echo "scripts/test.sh: unknown leg '$leg'" >&2; exit 2 ;;
  esac
done
