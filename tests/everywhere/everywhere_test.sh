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
cp "$source"/tests/everywhere/{everywhere,row.sh,table.awk} tests/everywhere
echo "The page's own words." >docs/everywhere.md
cat >tests/everywhere/rows <<'END'
# a comment
old   bookworm  i386   gcc,g++        -    build,unit
new   trixie    amd64  clang,clang++  -O3  build,unit
mine  trixie    amd64  gcc,g++        -    readme
END
printf 'any cmake\nany g++\namd64 lintian\n' >work/packages

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
chmod +x bin/* run
tar --create --file work/source.tar run tests
export PATH=$house/bin:$PATH CALLS=$house/calls SAYS=$house/says

everywhere() { tests/everywhere/everywhere "$house/work" "$@" >out 2>said; }

# The lines of a row, without the seconds of commands and the day.
lines() { # FILE ROW
  grep "^$2"$'\t' "$1" | sed -E 's/\t[0-9]+\t([^\t]*)\t[-0-9]+$/\t\1/'
}

fails() {
  if "$@"; then return 1; fi
}

printf '%s\n' 'unit         33 s   771 passed     0 failed     2 skipped' 'skipped: unit.A.B: there is no air' >says
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
  options)
    everywhere new
    grep -qxF 'cmake --preset tests -DCMAKE_C_COMPILER=clang -DCMAKE_CXX_COMPILER=clang++ -DCMAKE_C_FLAGS_RELWITHDEBINFO=-O3 -DCMAKE_CXX_FLAGS_RELWITHDEBINFO=-O3 -DMERO_LIBRARY_OPTIONS=-O3' calls
    grep -q ' tests trixie amd64 .*cmake g++ lintian$' work/roots
    ;;
  newcomer)
    printf '%s\n' 'style         3 s     6 passed     0 failed     0 skipped' >>says
    everywhere mine
    lines work/seen.tsv mine | cut -f 1-5 |
      diff <(printf 'mine\tdemo\t1\t0\t0\nmine\tunit\t771\t0\t2\nmine\tstyle\t6\t0\t0\n') -
    diff - calls <<<$'run demo\nrun test'
    grep -q ' newcomer trixie amd64 ca-certificates git$' work/roots
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
  failed)
    printf '%s\n' 'unit         33 s   770 passed     1 failed     0 skipped' "$(printf '\t 12 - unit.A.C (Failed)')" >says
    fails everywhere new
    lines work/seen.tsv new | tail -n 1 | diff <(printf 'new\tunit\t770\t1\t0\tfailed: unit.A.C\n') -
    grep -q '^everywhere: new, unit: 1 failed; its log is in .*/work/rows/new$' said
    ;;
  ended)
    echo 'run: the tests build failed' >says
    fails everywhere new
    lines work/seen.tsv new | tail -n 1 | diff <(printf 'new\tunit\t0\t1\t0\tfailed: it came to no end\n') -
    echo 'exit 1' >bin/cmake
    fails everywhere new
    lines work/seen.tsv new | cut -f 2-5 | diff <(printf 'build\t0\t1\t0\n') -
    echo 'in_debian() { return 1; }' >>tests/support/debian.sh
    fails everywhere new
    lines work/seen.tsv new | diff <(printf 'new\tbuild,unit\t0\t1\t0\tfailed: nothing was run\n') -
    ;;
  unknown)
    fails everywhere next
    grep -q "^everywhere: there is no row 'next'" said
    ;;
esac
