#!/bin/sh
# types_test.sh ABIDW ABIDIFF LIBRARY BASELINE HEADERS
#
# The library's functions, what they take and return, and the records and enumerations behind that are those that programs
# have been built with, down to the names of fields and constants.
set -eu
abidw=$1 abidiff=$2 library=$3 baseline=$4 headers=$5

work=$(mktemp -d)
trap 'rm -r "$work"' EXIT

here=$(dirname "$0")
"$here/write-types" "$headers" "$abidw" "$library" "$work/now"
if ! "$abidiff" --suppressions "$here/system-types" --harmless --redundant --no-show-locs "$baseline" "$work/now"; then
	echo "$(basename "$library") has another interface than $(basename "$baseline") says; CONTRIBUTING.md tells what is frozen"
	exit 1
fi
