#!/bin/sh
# size_test.sh STRIP READELF LIMIT LIBRARY...
#
# What a program loads of the libraries (code, constants, data zeroed or not, and what the loader needs) is less than
# LIMIT bytes together. The files are told, too: the linker fills them up with as much as a page wherever a segment
# begins, so that one instruction more may make a file longer by a page, and a program's memory by nothing.
set -eu
strip=$1 readelf=$2 limit=$3
shift 3

work=$(mktemp -d)
trap 'rm -r "$work"' EXIT

loaded_of() { # LIBRARY
	bytes=0
	for size in $("$readelf" --segments --wide "$1" | awk '$1 == "LOAD" { print $6 }'); do
		bytes=$((bytes + size))
	done
	echo $bytes
}

total=0 files=0
for library in "$@"; do
	"$strip" -o "$work/stripped" "$library"
	loaded=$(loaded_of "$work/stripped")
	file=$(wc -c <"$work/stripped")
	echo "$loaded loaded of $file: $(basename "$library")"
	[ "$loaded" -gt 0 ]
	total=$((total + loaded)) files=$((files + file))
done
echo "$total loaded of $files together"
[ "$total" -lt "$limit" ]
