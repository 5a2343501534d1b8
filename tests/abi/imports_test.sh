#!/bin/sh
# imports_test.sh NM LIBC LIBRARY...
#
# What the libraries, as built on glibc, take from others is exported by one of them or by this other C library. Whatever
# glibc alone has is reached in another way, too: by a form of its own, which the tests on musl run.
set -eu
nm=$1 libc=$2
shift 2

work=$(mktemp -d)
trap 'rm -r "$work"' EXIT

has_another_form='posix_spawn_file_actions_addclosefrom_np'

names() { # nm's OPTION, FILE...
	"$nm" --dynamic --format=posix "$@" | sed -nE 's/^([^ @:]+)[@ ].*/\1/p' | sort -u
}

names --defined-only "$libc" "$@" >"$work/there"
# Where a function reads what a newer standard of C allows, glibc says so in its name.
names --undefined-only "$@" | sed 's/^__isoc[0-9]*_//' | sort -u >"$work/wanted"
[ -s "$work/wanted" ]
alone=$(comm -23 "$work/wanted" "$work/there" | grep -vxF "$has_another_form" | xargs)
if [ -n "$alone" ]; then
	echo "glibc alone has $alone"
	exit 1
fi
