#!/bin/sh
# size_test.sh STRIP LIMIT LIBRARY...
#
# The libraries as they are installed, without symbols and debugging information, take less than LIMIT bytes together.
set -eu
strip=$1 limit=$2
shift 2

work=$(mktemp -d)
trap 'rm -r "$work"' EXIT

total=0
for library in "$@"; do
  "$strip" -o "$work/stripped" "$library"
  size=$(wc -c < "$work/stripped")
  echo "$size $(basename "$library")"
  total=$((total + size))
done
echo "$total together"
[ "$total" -lt "$limit" ]
