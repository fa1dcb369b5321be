#!/usr/bin/env bash
# Builds and runs the tests: scripts/test.sh [LEG...]. Installs what a leg needs.
#   native (default)   this machine, g++, Release        asan          address and undefined behaviour sanitizers
#   debug              this machine, g++, Debug          tsan          thread sanitizer
#   clang              this machine, clang++, Release    armhf, armel  32-bit ARM under the emulator
#   hardened           with the flags of Debian's build  armhf-clang   32-bit ARM with clang
#   all                every one of these
set -euo pipefail
cd "$(dirname "$0")/.."
. scripts/need.sh

packages_of() {
  case $1 in
    clang) echo clang ;;
    hardened) echo dpkg-dev ;;
    armhf) echo qemu-user g++-arm-linux-gnueabihf googletest ;;
    armel) echo qemu-user g++-arm-linux-gnueabi googletest ;;
    armhf-clang) echo clang qemu-user g++-arm-linux-gnueabihf googletest ;;
  esac
}

run_leg() {
  local preset=$1 options=()
  case $1 in
    native) preset=release ;;
    debug) preset=dev ;;
  esac
  # shellcheck disable=SC2046
  need "${test_packages[@]}" $(packages_of "$1")
  if [ "$1" = hardened ]; then
    export DEB_BUILD_MAINT_OPTIONS=hardening=+all
    options=("-DCMAKE_CXX_FLAGS=$(dpkg-buildflags --get CPPFLAGS) $(DEB_CXXFLAGS_STRIP=-g dpkg-buildflags --get CXXFLAGS)"
      "-DCMAKE_SHARED_LINKER_FLAGS=$(dpkg-buildflags --get LDFLAGS)"
      "-DCMAKE_EXE_LINKER_FLAGS=$(dpkg-buildflags --get LDFLAGS)")
  fi
  [ "${CI:-}" != true ] || options+=(-DCMAKE_COMPILE_WARNING_AS_ERROR=ON)
  echo "== $1: building (build/$preset)"
  cmake --preset "$preset" "${options[@]}" >/dev/null
  cmake --build --preset "$preset" --parallel "$(nproc)"
  echo "== $1: testing"
  ctest --preset "$preset" --parallel "$(nproc)"
  [ "$1" != hardened ] || nm -D --undefined-only build/hardened/lib/libiscsieptool.so.1 | grep '__[a-z]*_chk@' ||
    { echo "hardened: the library is not" >&2; return 1; }
}

legs=(native debug clang hardened asan tsan armhf armel armhf-clang)
[ $# -gt 0 ] || set -- native
[ "$1" != all ] || set -- "${legs[@]}"
for leg in "$@"; do
  [[ " ${legs[*]} " = *" $leg "* ]] || { echo "scripts/test.sh: unknown leg '$leg', known: ${legs[*]}" >&2; exit 2; }
done
for leg in "$@"; do
  run_leg "$leg"
done
