#!/usr/bin/env bash
# Builds the programs, makes a sample store and walks through it. Installs what is missing.
set -euo pipefail
cd "$(dirname "$0")/.."
. scripts/need.sh
need "${build_packages[@]}" jq

echo "== Building (build/release)"
cmake --preset release >/dev/null
cmake --build --preset release --parallel "$(nproc)" --target epinspect epsample >/dev/null
PATH=$PWD/build/release/bin:$PATH

store=$(mktemp -d)
trap 'rm -rf "$store"' EXIT
say() { printf '\n== %s\n' "$*"; }
show() { printf '$ %s\n' "$*"; "$@"; }

say "A sample store; --root makes it stand for / of the target"
show epsample "$store"
inspect() { printf '$ epinspect --root STORE %s\n' "$*"; epinspect --root "$store" "$@"; }

say "What lies in the store"
inspect list

say "The files of the machine and of volume 1, one kind each"
inspect dump /var/db/iscsi/EP_JNL /volume1/@iSCSI/EP/EP_TBL /volume1/@iSCSI/EP/EP_FRI /volume1/@iSCSI/EP/EP_DAT_00000

say "From a LUN id to its map file"
inspect lun 1
map=$(epinspect --root "$store" path map 1)

say "The header block of the map file"
inspect dump "$map"

say "Some entries, by index"
inspect entry "$map" 0 400 512-514 0x310

say "All entries, merged into runs"
inspect map "$map" --count 896

say "The whole map as a picture"
inspect map "$map" --chart

say "Where byte 540000000 of LUN 1 lies, and what its extent starts with"
inspect locate 1 540000000
inspect read 1 --offset 514M --length 64 | cat

say "Whose space it is: LUN 3 is a snapshot of LUN 1"
inspect usage

say "Which LUN a bad sector hurts"
inspect owner /volume1/@iSCSI/EP/EP_DAT_00001 700000000

say "Who uses an extent"
inspect find --extent 4194816-4194818

say "What does not fit together: nothing here, one thing of each kind in a store that is broken on purpose"
inspect check
epsample --broken "$store/broken"
epinspect --root "$store/broken" check || [ $? -eq 3 ]

say "The start of an extent beyond 4 GiB, in hexadecimal and as it is"
inspect extent /volume1/@iSCSI/EP/EP_DAT_00000 5200 --extent-size 1M | cut -c 1-100
inspect extent /volume1/@iSCSI/EP/EP_DAT_00000 5200 --extent-size 1M --raw | sed -n 2,3p

say "JSON for scripts: the holes of the first 1024 entries, through jq"
epinspect --root "$store" map "$map" --count 1024 --json | jq -c 'select(.hole and .count > 1) | [.first, .count]'
