#!/bin/bash
# everywhere_test.sh CASE
#
# Runs rows in a house of their own, where the systems are made of nothing, and ./run and cmake say what they are told to.
set -euo pipefail
source=$(realpath "$(dirname "$0")/../..")
house=$(mktemp -d)
trap 'rm -r "$house"' EXIT
cd "$house"

mkdir -p bin docs tests/everywhere tests/support work
cp "$source"/tests/everywhere/{everywhere,row.sh,systems.sh,table.awk} tests/everywhere
echo "The page's own words." >docs/everywhere.md
cat >tests/everywhere/rows <<'END'
# a comment
old   bookworm  i386   gcc,g++        -    build,unit
new   trixie    amd64  clang,clang++  -O3  build,unit
mine  trixie    amd64  gcc,g++        -    readme
safe  trixie    amd64  clang,clang++  -    asan
arm   bookworm  armhf  arm-linux-gnueabihf-gcc,arm-linux-gnueabihf-g++  -  unit
END
printf 'any cmake\nany g++\namd64 lintian\n' >work/packages
echo abcdef0 >work/sources

# A system is a directory.
cat >tests/support/debian.sh <<'END'
debian_root() { echo "$*" >>"$work/roots"; }
in_debian() {
  local row=$3
  [[ $2 == -b && $4 == /srv/row && $5 == -b && $7 == /srv/ccache ]] || exit 1
  shift 7
  set -- "${@//\/srv\/row/"$row"}"
  "${@//\/root/"$(mktemp -d -p "$work")"}"
}
END
cat >bin/cmake <<'END'
#!/bin/bash
echo "cmake $*"  >>"$CALLS"
END
cat >bin/linux32 <<'END'
#!/bin/bash
echo linux32 >>"$CALLS" && exec "$@"
END
cat >run <<'END'
#!/bin/bash
echo "run $*" >>"$CALLS"
[[ $1 == test ]] || exit 0
cat "$SAYS"
END
# The rows' processors are others than this machine's or not, whatever it is.
cat >bin/dpkg <<'END'
#!/bin/bash
echo amd64
END
chmod +x bin/* run
cat >tests/everywhere/emulated <<'END'
#!/bin/bash
echo "emulated with $DEB_HOST_GNU_TYPE by ${CMAKE_TOOLCHAIN_FILE##*/merowireless/}" >>"$CALLS" && exec "$@"
END
chmod +x tests/everywhere/emulated
tar --create --file work/source.tar run tests
export PATH=$house/bin:$PATH CALLS=$house/calls SAYS=$house/says

everywhere() { tests/everywhere/everywhere "$house/work" "$@" >out 2>said; }

# The lines of a row, without its words, the seconds, the day and the commit.
lines() { # FILE ROW
  grep "^$2"$'\t' "$1" | cut -f 1,6- | sed -E 's/\t[0-9]+\t([^\t]*)\t[-0-9]+\tabcdef0$/\t\1/'
}

fails() {
  if "$@"; then return 1; fi
}

printf '%s\n' 'testing (unit)' 'unit         33 s   771 passed     0 failed     2 skipped' \
  'skipped: unit.A.B: there is no air' >says
case $1 in
  counted)
    everywhere old
    lines work/seen.tsv old | diff <(printf 'old\tbuild\t1\t0\t0\t\nold\tunit\t771\t0\t2\tskipped: unit.A.B: there is no air\n') -
    grep -qF '| old | Debian 12 | i386 | gcc | unit | 771 | 0 | 2 (1) | 33 |' out
    diff - calls <<'END'
linux32
cmake --preset tests -DCMAKE_C_COMPILER=gcc -DCMAKE_CXX_COMPILER=g++
cmake --build --preset tests -- -k 0
run test unit
END
    fails grep -q lintian work/roots
    ;;
  options) # The build's own were lost, and what has no others was not optimized.
    everywhere new
    grep -qxF 'cmake --preset tests -DCMAKE_C_COMPILER=clang -DCMAKE_CXX_COMPILER=clang++ -DCMAKE_C_FLAGS_RELWITHDEBINFO=-O2 -g -DNDEBUG -O3 -DCMAKE_CXX_FLAGS_RELWITHDEBINFO=-O2 -g -DNDEBUG -O3 -DMERO_LIBRARY_OPTIONS=-O3' calls
    grep -q ' tests trixie amd64 .*cmake g++ lintian$' work/roots
    ;;
  sanitized) # It was told of another compiler than the one that its build has, and lost what it was told of sanitizers.
    sed -i 's/unit/asan/' says
    everywhere safe
    diff - calls <<<'run test asan'
    ;;
  newcomer)
    printf '%s\n' 'testing (style)' 'style         3 s     6 passed     0 failed     0 skipped' >>says
    everywhere mine
    lines work/seen.tsv mine | # Each level was told to have skipped what one of them had.
      diff <(printf 'mine\t%s\n' $'demo\t1\t0\t0\t' $'unit\t771\t0\t2\tskipped: unit.A.B: there is no air' \
        $'style\t6\t0\t0\t') -
    diff - calls <<<$'run demo\nrun test'
    grep -q ' newcomer trixie amd64 ca-certificates git$' work/roots
    ;;
  emulated)
    printf 'any %s\n' gcc-multilib libc++-dev libcli11-dev libnl-genl-3-dev pkg-config >>work/packages
    everywhere arm
    head -n 1 calls | grep -qx 'emulated with arm-linux-gnueabihf by cmake/cross.cmake'
    grep -qx 'run test unit' calls
    # What is linked is for that processor, and what is run for this machine's.
    for package in crossbuild-essential-armhf cmake libc++-dev libcli11-dev libnl-genl-3-dev:armhf pkg-config:armhf; do
      sed 's/$/ /' work/roots | grep -qF " $package "
    done
    grep -q "^[^ ]* tests bookworm amd64,armhf " work/roots
    fails grep -q multilib work/roots
    ;;
  impossible)
    cp "$source/tests/everywhere/possible" tests/everywhere
    echo 'Calls.* the emulator has calls of its own' >tests/everywhere/not-emulated
    tests/everywhere/possible echo --gtest_filter=Calls.OfASave | diff - <(
      printf '%s\n' '[  SKIPPED ] Calls.OfASave' 'the emulator has calls of its own')
    [[ $(tests/everywhere/possible echo --gtest_filter=Files.Are) == --gtest_filter=Files.Are ]]
    [[ $(tests/everywhere/possible echo --gtest_list_tests) == --gtest_list_tests ]]
    ;;
  kept)
    everywhere -k old
    everywhere -k new
    sed -i 's/771/770/' says
    everywhere -k old
    lines tests/everywhere/seen.tsv old | cut -f 3 | diff <(printf '1\n770\n') -
    [[ $(lines tests/everywhere/seen.tsv new | wc -l) -eq 2 && $(wc -l <tests/everywhere/seen.tsv) -eq 4 ]]
    head -n 1 docs/everywhere.md | grep -q "^The page's own words"
    everywhere -t
    sed '1,2d' docs/everywhere.md | diff out -
    everywhere new
    fails grep -q ' 769 ' docs/everywhere.md
    ;;
  failed) # A later ctest has the labels of a test behind it.
    printf '%s\n' 'testing (unit)' 'unit         33 s   769 passed     3 failed     0 skipped' \
      $'\t 12 - unit.A.C (Failed)' $'\t 13 - unit.A.D (ILLEGAL) unit' \
      $'\t 14 - unit.B/E.F/0  # GetParam() = ("x (y)", 7) (Failed) unit' $'\t 15 - unit.G.H (Skipped)' >says
    fails everywhere new
    lines work/seen.tsv new | tail -n 1 | diff <(printf 'new\tunit\t769\t3\t0\tfailed: unit.A.C|failed: unit.A.D|failed: unit.B/E.F/0\n') -
    grep -q '^everywhere: new, unit: 3 failed; its log is in .*/rows/new$' said
    ;;
  ended)
    echo 'run: the tests build failed' >says
    fails everywhere new
    lines work/seen.tsv new | tail -n 1 | diff <(printf 'new\tunit\t0\t1\t0\tfailed: it came to no end\n') -
    # Levels that were not run were not told of, and nothing had failed.
    printf '#!/bin/sh\nexit 1\n' >bin/cmake
    fails everywhere new
    lines work/seen.tsv new |
      diff <(printf 'new\tbuild\t0\t1\t0\t\nnew\tunit\t0\t1\t0\tfailed: it came to no end\n') -
    echo 'in_debian() { return 1; }' >>tests/support/debian.sh
    fails everywhere new mine
    lines work/seen.tsv new | diff <(printf 'new\t%s\t0\t1\t0\tfailed: it came to no end\n' build unit) -
    lines work/seen.tsv mine | diff <(printf 'mine\t%s\t0\t1\t0\tfailed: it came to no end\n' demo test) -
    ;;
  empty) # A level whose tests were all skipped has shown nothing, and was taken for one that passed.
    sed -i 's/771 passed/  0 passed/' says
    fails everywhere new
    grep -q '^everywhere: new, unit: 0 failed; its log is in ' said
    ;;
  without) # The rows behind one whose system could not be made were not run.
    # shellcheck disable=SC2016  # for the shell there
    echo 'debian_root() { [[ $3 == trixie ]]; }' >>tests/support/debian.sh
    fails everywhere old new
    lines work/seen.tsv old | diff <(printf 'old\t%s\t0\t1\t0\tfailed: there is no system for it\n' build unit) -
    lines work/seen.tsv new | cut -f 2-5 | diff <(printf 'build\t1\t0\t0\nunit\t771\t0\t2\n') -
    ;;
  interrupted) # What a row had come to until then took the place of its result.
    everywhere -k old
    cp tests/everywhere/seen.tsv before
    # shellcheck disable=SC2016  # for the shells there
    echo 'in_debian() { bash -c '\''kill -INT "$PPID"; exit 130'\''; }' >>tests/support/debian.sh
    env --default-signal=INT tests/everywhere/everywhere "$house/work" -k old new >out 2>said || status=$?
    [[ $status -eq 130 ]]
    diff before tests/everywhere/seen.tsv
    ;;
  unknown)
    fails everywhere next
    grep -q "^everywhere: there is no row 'next'" said
    ;;
esac
