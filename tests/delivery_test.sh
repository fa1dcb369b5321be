#!/usr/bin/env bash
# What is delivered: exported symbols, an installation that may be moved, its consumers, and how files are opened.
# delivery_test.sh SOURCE_DIR BUILD_DIR
set -euo pipefail
source=$1 build=$2 scratch=$(mktemp -d)
trap 'rm -rf "$scratch"' EXIT
fail() { echo "$*" >&2; exit 1; }

# Nothing but the eight classes leaves the library.
classes='ISCSI::TOOL::(ISCSIEPFile(TBL|MAP|DAT|FRI|JNL)?|ISCSIEPMapEntryInfo|ISCSILUNConfInfo)'
symbols=$(nm -DC --defined-only "$build/lib/libiscsieptool.so.1" | cut -d' ' -f3-)
! grep -vE "^((vtable|typeinfo|typeinfo name) for $classes$|$classes::)" <<<"$symbols" || fail "exported too much"
[ "$(grep -cE "^vtable for $classes$" <<<"$symbols")" = 8 ] || fail "a class is missing"

# The log is written by a call of that name, which a caller can watch, however the library is built.
[ "$(nm -D --undefined-only "$build/lib/libiscsieptool.so.1" | grep -o '[a-z_]*syslog[a-z_]*')" = syslog ] ||
  fail "the log is not written by syslog"

# An installation works wherever it is moved, for both kinds of consumer.
cmake --install "$build" --prefix "$scratch/first" >/dev/null
mv "$scratch/first" "$scratch/moved"
# With the programs come their manual pages, and every document that these name.
mapfile -t documents < <(grep -ohE '[a-z-]+\.md$' "$scratch"/moved/share/man/man1/*.1 | sort -u)
[ "${#documents[@]}" -gt 0 ] || fail "the manual names no document"
for document in "${documents[@]}"; do
  [ -s "$scratch/moved/share/doc/epinspect/$document" ] || fail "the manual names $document, which is not installed"
done
[ -s "$scratch/moved/share/man/man1/epsample.1" ] || fail "no manual page"
[ -s "$scratch/moved/share/bash-completion/completions/epinspect" ] || fail "no completion"

export PKG_CONFIG_PATH=$scratch/moved/lib/pkgconfig LD_LIBRARY_PATH=$scratch/moved/lib
cp -r "$source/examples/consumer" "$scratch/pkgconfig"
make -s -C "$scratch/pkgconfig"
cmake -S "$source/examples/consumer" -B "$scratch/cmake" -DCMAKE_PREFIX_PATH="$scratch/moved" >/dev/null
cmake --build "$scratch/cmake" >/dev/null
"$scratch/moved/bin/epsample" "$scratch/store"
maps=("$scratch"/store/volume1/@iSCSI/LUN/*) map=${maps[0]}
consumed=$("$scratch/cmake/consumer" "$map")
[ "$consumed" = "$("$scratch/pkgconfig/consumer" "$map")" ] || fail "consumers differ"
unset LD_LIBRARY_PATH
inspect=$scratch/moved/bin/epinspect
shown=$("$inspect" dump "$map" && "$inspect" entry "$map" 0 | sed 's/^0: //')
[ "$consumed" = "$shown" ] || fail "the program and a consumer differ"

# Everything is opened for reading only, nothing is locked; a lookup makes four calls, a header block takes one read.
store=$scratch/store
for arguments in "dump $map $store/var/db/iscsi/EP_JNL" "entry $map 5" "map --chart $map" "path tbl /volume1/x" \
  "extent $store/volume1/@iSCSI/EP/EP_DAT_00000 1 --extent-size 1M" "lun 1 --root $store" "path map 1 --root $store"; do
  # shellcheck disable=SC2086
  strace -f -o "$scratch/trace" "$inspect" $arguments >/dev/null
  ! grep -E 'O_(WRONLY|RDWR|CREAT|TRUNC)|flock|F_SETLK|^[0-9]+ +(unlink|rename|mkdir|trunc|chmod)' "$scratch/trace" ||
    fail "$arguments writes"
done
strace -e trace=openat,lseek,read,close -o "$scratch/trace" "$inspect" entry "$map" 5
calls=$(sed -n "\\|$map|,\$p" "$scratch/trace" | sed -E 's/\(.*, ([0-9]+)\) += ([0-9]+)$/ \1 \2/; s/\(.*//' | head -n 7)
expected=$'openat\nread 24576 24576\nclose\nopenat\nlseek\nread 8 8\nclose'
[ "$calls" = "$expected" ] || fail "unexpected calls: $calls"
