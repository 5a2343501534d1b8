#!/bin/sh
# sources_test.sh CMAKE NINJA
#
# A source or a scenario that is added is found by the next build. What editors leave beside a file that is being edited
# is not: their link to nowhere, such as .#list.cpp, once was a source that the build could not find.
set -eu
source=$(dirname "$(realpath "$0")")/../..
cmake=$1 ninja=$2
work=$(mktemp -d)
trap 'rm -r "$work"' EXIT
mkdir "$work/tree"
(cd "$source" && cp -r CMakeLists.txt ./*.md appliance bench cmake common docs examples include lib platform tests \
	tools "$work/tree")
cd "$work/tree"

run() { "$@" >../log 2>&1 || { cat ../log && exit 1; }; }

# The other directories have sources of programs alone, which are listed, or that this compiler may not build.
directories=$(find appliance/sbin lib platform tests tools -name '*.cpp' | sed 's,/[^/]*$,,' | sort -u |
	grep -vxE 'tests/(abi|fault/table|fuzz|lab|lab/peers|package)|tools')
for place in $directories; do ln -s nobody@nowhere "$place/.#list.cpp"; done
for place in tests/lab/scenarios/a.sh appliance/lib/a.sh docs/a.md docs/man/a.5 docs/man/a.3.in; do
	ln -s nobody@nowhere "${place%/*}/.#${place##*/}"
done
run "$cmake" -S . -B ../build -G Ninja "-DCMAKE_MAKE_PROGRAM=$ninja" -DBUILD_TESTING=ON

for place in $directories; do touch "$place/added_test.cpp"; done
touch tests/lab/scenarios/added.sh
run "$ninja" -C ../build build.ninja
for place in $directories; do
	if ! grep -q "/$place/" ../build/CMakeFiles/VerifyGlobs.cmake || ! grep -q "/$place/added_test\.cpp" ../build/build.ninja
	then
		echo "$place/added_test.cpp is not found"
		exit 1
	fi
done
grep -q ' "added")$' ../build/tests/lab/CTestTestfile.cmake || { echo 'the scenario is not found' && exit 1; }
if grep -rF "/.#" ../build/build.ninja ../build/cmake_install.cmake ../build/*/cmake_install.cmake; then exit 1; fi
