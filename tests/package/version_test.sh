#!/bin/sh
# version_test.sh SOURCE-DIRECTORY: what is built from sources that have changed since a release is of a later version, so
# that apt takes it for an upgrade; what is released has the version that CHANGELOG.md gives it.
set -eu
cd "$1"

released=$(sed -nE 's/^## ([0-9][^ ]*) .*/\1/p' CHANGELOG.md | head -n 1)
built=$(sed -nE 's/^project\(.* VERSION ([^ ]+) .*/\1/p' CMakeLists.txt)
packaged=$(sed -nE '1s/^[^ ]+ \(([^)]*)\).*/\1/p' debian/changelog)
[ -n "$released" ] && [ -n "$built" ]

relation=eq
! grep -qx '## Unreleased' CHANGELOG.md || relation=gt
dpkg --compare-versions "$built" $relation "$released" || {
	echo "CMakeLists.txt has the version $built, and CHANGELOG.md has released $released" >&2
	exit 1
}
[ "$packaged" = "$built" ] || {
	echo "CMakeLists.txt has the version $built, and debian/changelog has $packaged" >&2
	exit 1
}
