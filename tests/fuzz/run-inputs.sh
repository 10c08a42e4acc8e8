#!/bin/sh
# run-inputs.sh <harness> <folder>...
# Runs every regular file in the folders (missing folders are skipped)
# through the harness once; fails when any of them makes it fail.
set -e
harness=$1
shift
list=$(mktemp)
trap 'rm -f "$list"' EXIT
for dir in "$@"; do
    [ -d "$dir" ] && find "$dir" -type f ! -name '.*' | sort >> "$list"
done
if [ ! -s "$list" ]; then
    echo "no inputs for $harness"
    exit 0
fi
# File names carry no spaces (seeds and regressions are ours).
# shellcheck disable=SC2046
exec "$harness" $(cat "$list")
