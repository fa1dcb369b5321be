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

scratch=$(mktemp -d)
trap 'rm -rf "$scratch"' EXIT
cd "$scratch"
say() { printf '\n== %s\n' "$*"; }
show() { printf '$ %s\n' "$*"; "$@"; }

say "A sample store; --root makes it stand for / of the target"
show epsample store
inspect() { show epinspect --root store "$@"; }

say "Is this store sound? It is, and one is not"
inspect check
show epsample --broken broken
show epinspect --root broken check || [ $? -eq 3 ]

say "What lies in it?"
inspect list

say "Whose space is it? LUN 3 is a snapshot of LUN 1"
inspect usage

say "Which LUN does a bad sector hurt?"
inspect owner /volume1/@iSCSI/EP/EP_DAT_00001 700000000

say "Where does byte 540000000 of LUN 1 lie, and which entries point at that extent?"
inspect locate 1 540000000
inspect find --extent 4194818

say "Give me the disk: an image with holes, and some bytes"
inspect read 2 --output lun2.image
inspect read 1 --offset 514M --length 64 | cat

say "Give me something to take along: all but the data"
inspect collect to-take-along

say "What has changed since? One flag of one entry"
printf '\020' | dd of="to-take-along$(epinspect --root store path map 1)" bs=1 seek=24583 conv=notrunc status=none
show epinspect diff to-take-along store || [ $? -eq 3 ]

say "What does a map look like? Its entries as runs, as a picture, and one by one"
inspect map 1 --count 896
inspect map 1 --chart
inspect entry 1 0 400 512-514 0x310

say "What does a file hold? The files of the machine and of volume 1, one kind each, a LUN, and an extent"
inspect dump /var/db/iscsi/EP_JNL /volume1/@iSCSI/EP/EP_TBL /volume1/@iSCSI/EP/EP_FRI /volume1/@iSCSI/EP/EP_DAT_00000 1
inspect lun 1
inspect extent /volume1/@iSCSI/EP/EP_DAT_00000 5200 --extent-size 1M | cut -c 1-100
inspect extent /volume1/@iSCSI/EP/EP_DAT_00000 5200 --extent-size 1M --raw | sed -n 2,3p

say "And in a script? JSON: the holes of the first 1024 entries, through jq"
epinspect --root store map 1 --count 1024 --json | jq -c 'select(.hole and .count > 1) | [.first, .count]'
