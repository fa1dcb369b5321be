#!/usr/bin/env bash
# Runs what the console blocks of documents show and compares: scripts/transcript.sh [--renew] DOCUMENT...
# With --renew the documents show from then on what is really printed.
# A block is run when its fence reads ```console. After "$ " stands a command, after "> " each further line of it, and
# then follows what it prints. All commands of a document run in one shell, in a new folder, with the time zone UTC.
set -euo pipefail
export TZ=UTC LC_ALL=C.UTF-8
unset COLUMNS
scratch=$(mktemp -d)
trap 'rm -rf "$scratch"' EXIT

# Runs the commands of $1, the lines of all blocks, and prints the blocks as they should have read; ``` ends each.
replay() (
  set +euo pipefail
  shopt -s expand_aliases
  mkdir "$scratch/folder" && cd "$scratch/folder" || exit
  run() { # takes over the status of the command before, so that $? may be shown
    (exit "$status")
    eval "$command" >"$scratch/output" 2>&1 </dev/null
    status=$?
    cat "$scratch/output" >&4
    [ -z "$(tail -c 1 "$scratch/output")" ] || echo >&4
    command=
  }
  status=0 command=
  while IFS= read -r line <&3; do
    case $line in
      '$ '* | '> '*)
        [ "${line::1}" = '>' ] || [ -z "$command" ] || run
        printf '%s\n' "$line" >&4
        command+=${command:+$'\n'}${line:2}
        ;;
      '```')
        [ -z "$command" ] || run
        echo '```' >&4
        ;;
    esac
  done 3<<<"$1"
) 4>&1

renew=
[ "${1:-}" != --renew ] || { renew=yes && shift; }
differing=0
for document in "$@"; do
  shown=$(awk 'console; /^```/ { console = $0 == "```console" }' "$document")
  [ -n "$shown" ] || { echo "$document: no console block" >&2; exit 1; }
  rm -rf "$scratch/folder"
  replay "$shown" >"$scratch/real"
  if [ "$renew" ]; then
    awk -v real="$scratch/real" '
      /^```$/ { console = 0 }
      !console
      /^```console$/ { console = 1; while ((getline line < real) > 0 && line != "```") print line }
    ' "$document" >"$scratch/renewed"
    cp "$scratch/renewed" "$document"
    continue
  fi
  diff -u --label "$document" --label "really printed" - "$scratch/real" <<<"$shown" || differing=1
  echo "$document: $(grep -c '^\$ ' <<<"$shown") commands compared"
done
exit "$differing"
