#!/usr/bin/env bash
# Builds epinspect as one file that needs no library, for a target where nothing can be installed:
# scripts/portable.sh [armel|armhf|amd64]. armel, the default, runs on every 32-bit ARM. The program is tried first: it
# does what the README shows while the folder that stands for / holds no library. Then it is put into
# build/portable/ARCHITECTURE.
set -euo pipefail
cd "$(dirname "$0")/.."
. scripts/need.sh
fail() { echo "scripts/portable.sh: $*" >&2; exit 1; }

architecture=${1:-armel}
build=Release
case $architecture in # the oldest processor that Debian's programs for it run on
  armel) compiler=g++-arm-linux-gnueabi processor=arm926 ;;
  armhf) compiler=g++-arm-linux-gnueabihf processor=cortex-a8 ;;
  amd64) compiler=g++ processor='' build=MinSizeRel ;; # as Release too large
  *) echo "scripts/portable.sh: unknown architecture '$architecture', known: armel armhf amd64" >&2 && exit 2 ;;
esac
need "${build_packages[@]}" binutils jq "$compiler" ${processor:+qemu-user-static}
setup=(-DISCSIEPTOOL_STATIC=ON -DBUILD_TESTING=OFF -DISCSIEPTOOL_BUILD_BENCH=OFF -DCMAKE_UNITY_BUILD=ON
  "-DCMAKE_BUILD_TYPE=$build" "-DCMAKE_CXX_FLAGS_RELEASE=-O2 -DNDEBUG")
if [ "$processor" ]; then
  setup+=("-DCMAKE_TOOLCHAIN_FILE=$PWD/cmake/$architecture.cmake")
elif [ "$(dpkg --print-architecture)" != amd64 ]; then
  fail "amd64 is built on 64-bit x86 only"
fi

folder=build/portable/$architecture
rm -f "$folder/epinspect"
cmake -S . -B "$folder/build" "${setup[@]}" >/dev/null
cmake --build "$folder/build" --parallel "$(nproc)" --target epinspect
program=$folder/build/bin/epinspect

! readelf -lW "$program" | grep -E '^ +(INTERP|DYNAMIC)' || fail "$program needs a library"
[ "$(readelf -lW "$program" | awk '$1 == "LOAD" { print $NF }' | sort -u)" = 0x10000 ] ||
  fail "$program does not fit memory pages of 64 KiB"
size=$(stat -c %s "$program")
[ "$size" -lt 2500000 ] || fail "$program has $size bytes"

# Everything else that the README calls is of this machine, the maker of the sample store too.
cmake --preset release >/dev/null
cmake --build --preset release --parallel "$(nproc)" --target epsample >/dev/null
scratch=$(mktemp -d)
trap 'rm -rf "$scratch"' EXIT
mkdir "$scratch/bin"
cp build/release/bin/epsample "$scratch/bin"
cat >"$scratch/bin/epinspect" <<END
#!/usr/bin/env bash
# Runs epinspect while the current folder stands for /. It holds the program and what the README's commands made.
. '$PWD/scripts/need.sh'
[ -e epinspect ] || cp '$PWD/$program' ${processor:+"$(command -v qemu-arm-static)"} .
as_root env TZ="\$TZ" LC_ALL="\$LC_ALL" chroot . ${processor:+/qemu-arm-static -cpu $processor} /epinspect "\$@"
END
chmod +x "$scratch/bin/epinspect"
# Without the files of a character set pictures are drawn in ASCII.
LC_ALL=C.UTF-8 sed 'y/·░▒▓█/.-+*#/' README.md >"$scratch/README.md"
PATH=$scratch/bin:$PATH scripts/transcript.sh "$scratch/README.md"

cp "$program" "$folder"
echo "$folder/epinspect: $size bytes, needs no library"
