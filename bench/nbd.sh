#!/usr/bin/env bash
# How fast a LUN of SIZE bytes (default 2G), all mapped and in the page cache, is read: through the plugin against nbdkit's
# own file plugin on the same bytes in one file, and by `read`, `read --output` and `dd` to files. The best of ROUNDS (7)
# in turn. bench/nbd.sh [BUILD_DIR [OTHER_EPINSPECT]]: another program, an older version for instance, is measured too.
# Takes twice SIZE of disk, and SIZE of memory for the image.
set -euo pipefail
build=$(realpath "${1:-build/release}") other=${2:+$(realpath "$2")}
plugin=$build/lib/nbdkit-ep-plugin.so
[ -e "$plugin" ] || { echo "$plugin is not there: it is built where nbdkit-plugin-dev is installed" >&2; exit 1; }
scratch=$(mktemp -d "${TMPDIR:-/var/tmp}/epnbdXXXXXX")
image=$(mktemp -u /dev/shm/epnbdXXXXXX)
trap 'rm -rf "$scratch" "$image"' EXIT
cd "$scratch"
head -c "${SIZE:-2G}" /dev/urandom >disk
"$build/bin/epsample" --disk disk store
cat disk store/volume1/@iSCSI/EP/EP_DAT_* >/dev/null

declare -A best
run() { # NAME COMMAND...
  local name=$1 start end
  shift
  rm -f "$image"
  start=$(date +%s%N)
  "$@" >/dev/null
  end=$(date +%s%N)
  local took=$(((end - start) / 1000))
  [ "${best[$name]:-$took}" -lt "$took" ] || best[$name]=$took
}
# shellcheck disable=SC2016 # nbdkit sets uri
nbdcopied() { nbdkit -U - "$@" --run 'nbdcopy --connections=4 "$uri" null:'; }
written() { "$@" >"$image"; }
for ((round = 0; round < ${ROUNDS:-7}; ++round)); do
  run "file plugin" nbdcopied file disk
  run "ep plugin" nbdcopied "$plugin" 1 root=store
  run "read > image" written "$build/bin/epinspect" --root store read 1
  run "read --output image" "$build/bin/epinspect" --root store read 1 --output "$image"
  run "dd bs=1M > image" written dd if=disk bs=1M status=none
  [ -z "$other" ] || run "other read > image" written "$other" --root store read 1
done
cmp "$image" disk
for name in "${!best[@]}"; do
  printf '%-22s %8d ms %8d MiB/s\n' "$name" $((best[$name] / 1000)) $(($(stat -c %s disk) * 1000000 / 1048576 / best[$name]))
done | sort
printf 'ep plugin against file plugin: %d %% of the speed\n' $((100 * best["file plugin"] / best["ep plugin"]))
