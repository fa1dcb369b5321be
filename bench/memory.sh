#!/usr/bin/env bash
# How much memory each command takes, in KiB, on maps of ENTRIES entries (default: 1, 10 and 67 million): such as epsample
# makes, where every tenth entry starts a run, and in "each a run" with extents at random on a volume of 64 TiB, where
# every entry does. bench/memory.sh [BUILD_DIR]: needs 4 GiB of disk, GNU time and python3.
set -euo pipefail
bin=$(realpath "${1:-build/release}")/bin
scratch=$(mktemp -d "${TMPDIR:-/var/tmp}/epmemoryXXXXXX")
trap 'rm -rf "$scratch"' EXIT
cd "$scratch"

show() { # WHAT COMMAND...: findings and differences are no failure
  local status=0
  /usr/bin/time -q -f %M -o kib "${@:2}" >/dev/null 2>messages || status=$?
  [ "$status" -eq 0 ] || [ "$status" -eq 3 ] || { cat messages >&2; exit 1; }
  printf '%9d  %-22s %7d KiB\n' "$entries" "$1" "$(cat kib)"
}

for entries in ${ENTRIES:-1000000 10000000 67108864}; do
  rm -rf store
  "$bin/epsample" --map-entries "$entries" store
  inspect=("$bin/epinspect" --root store)
  map=store$("${inspect[@]}" path map 1)
  cp "$map" older
  show "map" "${inspect[@]}" map 1
  show "map --chart" "${inspect[@]}" map 1 --chart
  show "map --json" "${inspect[@]}" map 1 --json
  show "find" "${inspect[@]}" find 1 --pool 1
  show "diff" "$bin/epinspect" diff older "$map"
  show "read of 2 GiB" "${inspect[@]}" read 1 --length 2G
  show "owner" "${inspect[@]}" owner /volume1/@iSCSI/EP/EP_DAT_00000 700000000
  show "check" "${inspect[@]}" check
  show "usage" "${inspect[@]}" usage

  rm "$map" store/var/db/iscsi/luns.json
  volume=store/volume1/@iSCSI
  rm "$volume"/LUN/*
  for number in {0..15}; do
    file=$(printf '%s/EP/EP_DAT_%05d' "$volume" "$number")
    [ "$number" -lt 2 ] || cp --sparse=always "$volume/EP/EP_DAT_00000" "$file"
    truncate -s $((24576 + (1 << 42))) "$file"
  done
  head -c 24576 older >"$volume/LUN/scattered"
  # An odd step visits each of the 2^26 extents once.
  python3 -c 'import array, sys
for first in range(0, int(sys.argv[1]), 1 << 16):
    last = min(first + (1 << 16), int(sys.argv[1]))
    array.array("Q", (i * 40503001 % (1 << 26) | 1 << 63 for i in range(first, last))).tofile(sys.stdout.buffer)
' "$entries" >>"$volume/LUN/scattered"
  show "check, each a run" "${inspect[@]}" check --extent-size 1M
  show "usage, each a run" "${inspect[@]}" usage --extent-size 1M
done
