#!/bin/bash
# run_test.sh CASE
#
# Looks at what ./run asks of the machine that it runs on: a copy of it stands in a house of its own, where no package is
# installed but those in `installed`, and where the commands that it calls note what they are called for.
set -euo pipefail
source=$(realpath "$(dirname "$0")/../..")
house=$(mktemp -d)
trap 'rm -r "$house"' EXIT
cd "$house"

# command_from NAME: makes a command of what is on standard input.
command_from() {
  { echo '#!/bin/bash' && cat; } >"$1"
  chmod +x "$1"
}

mkdir -p bench bin build/bench docs/pictures lib tests/{coverage,everywhere,fuzz,lab/scenarios,package}
cp "$source"/{.gitignore,run} .
touch lib/unit.cpp tests/lab/scenarios/{a-scan,b-join}.sh
git init --quiet
# shellcheck disable=SC2016  # for the shells of the commands
{
  command_from bin/dpkg-query <<<'grep -x "${*: -1} .*" installed | cut -d " " -f 2-'
  command_from bin/sudo <<<'exec "$@"'
  command_from bin/cmake <<<'echo "cmake $*" >>calls
    mkdir -p build && echo c++ -fno-move-loop-invariants -O2 >build/compile_commands.json'
  command_from bin/clang-tidy <<<'echo "clang-tidy of this machine ${*: -1}" >>calls'
  command_from bin/clang-tidy-19 <<<'echo "clang-tidy-19 ${*: -1}" >>calls'
  command_from bench/pictures <<<'echo "pictures $* $(cat "$1"/scanning.tsv)" >>calls'
  command_from bench/tables <<<'echo "tables $* with $PEERS" >>calls'
  command_from bin/clang-format <<<'echo "clang-format of this machine $*" >>calls'
  command_from bin/clang-format-19 <<<'echo "clang-format-19 $*" >>calls'
  command_from bin/shellcheck <<<'exit 0'
  command_from tests/everywhere/everywhere <<<'echo "everywhere $*" >>calls; tar --list --file "$1/source.tar" | sort >"$1/files"'
  command_from tests/coverage/coverage <<<'echo "coverage $*" >>calls'
  command_from tests/fuzz/fuzz <<<'echo "fuzz $*" >>calls; printf "rows\t7\t1 of 1\t2 of 2\t%s\n" 0 1 >"$2/table"; exit 1'
  command_from docs/make_html.sh <<<'echo "make_html.sh $*" >>calls'
  command_from tests/package/foreign_test.sh <<<'echo "foreign_test.sh $*" >>calls; echo not ok; [[ ! -e wrong ]]'
  command_from tests/everywhere/cross <<<'echo "cross $* with $(cd "$3/source" && echo lib/*)" >>calls'
}
# The packages in `exclusions`, one a line, exclude a cross compiler, which the real one removes without a question too.
# Those in `unknown` are in no archive. With `offline`, no archive is within reach.
command_from bin/apt-get <<'END'
packages=()
for word; do [[ $word == -* || $word == install ]] || packages+=("$word"); done
[[ ! -e offline || $1 == --simulate ]] || exit 100
[[ $1 != update ]] || exit 0
if printf '%s\n' "${packages[@]}" | grep -qxFf unknown; then exit 100; fi
if [[ $1 == --simulate ]]; then
  if printf '%s\n' "${packages[@]}" | grep -qxFf exclusions; then echo 'Remv gcc-aarch64-linux-gnu [4:12.2.0-3]'; fi
elif [[ " $* " == *' --no-remove '* ]]; then
  printf '%s\n' "${packages[@]}" >>packages
fi
END
: >exclusions
: >unknown
: >installed
# As the real one does, it names one scenario after the other.
command_from tests/lab/lab <<'END'
case $1 in
  packages) echo qemu ;;
  peers) echo /peers ;;
  list) for name in a-scan b-join; do echo "$name  What it shows." && sleep 0.1; done ;;
  *) echo "lab $*" >>calls ;;
esac
END
PATH=$house/bin:$PATH

# Notes what it calls, and what it installs; shows what it says when it fails.
run() {
  : >calls
  : >packages
  ./run "$@" >said 2>&1 || { cat said && return 1; }
}

lines() { [[ $# -eq 0 ]] || printf '%s\n' "$@"; }

expect_calls() { lines "$@" | diff - calls; }

expect_packages() { lines "$@" | sort | diff - <(sort -u packages); }

expect_sources() { diff - build/everywhere/sources <<<"$1"; }

# What the packages are built with, and a compiler, which who makes packages has anyway.
build_packages() {
  echo g++
  sed -n 's/^Build-Depends://; T; :next; p; n; /^ /b next' "$source/debian/control" | grep -oE '^ +[a-z0-9+-]+' |
    tr -d ' ' | grep -vx debhelper-compat
}

mapfile -t building < <(build_packages)
case $1 in
  build)
    run build
    expect_calls 'cmake --preset release' 'cmake --build --preset release'
    expect_packages "${building[@]}"
    ;;
  demo)
    run demo
    expect_calls 'cmake --preset release' 'cmake --build --preset lab' 'lab demo'
    expect_packages "${building[@]}" qemu
    ;;
  docs)
    run docs
    expect_calls 'make_html.sh . build/docs'
    expect_packages cmark-gfm mandoc
    ;;
  bench)
    echo g++-multilib >unknown # which is for processors that have words of two sizes
    run bench size
    expect_calls 'cmake --preset release' 'cmake --build --preset bench' 'tables build size with '
    run bench save starting
    grep -qx 'tables build save starting with /peers' calls
    run bench
    grep -qx 'tables build with /peers' calls
    ;;
  pictures)
    echo 'Scan/10 300' >build/bench/scanning.tsv
    run bench pictures
    expect_calls 'pictures docs/pictures Scan/10 300'
    expect_packages gnuplot-nox
    ;;
  lint) # Which version it was, the machine decided.
    run test lint
    expect_calls 'cmake --preset release' 'clang-tidy-19 lib/unit.cpp'
    grep -qx 'c++ -O2' build/lint/compile_commands.json # clang does not know the options of gcc
    expect_packages "${building[@]}" clang-tidy-19 git
    ;;
  format) # Which version it was, the machine decided.
    run format
    expect_calls 'clang-format-19 -i lib/unit.cpp'
    expect_packages clang-format-19 git
    { run test style || :; } >shown # the checks of the house are not here
    grep -qx 'clang-format-19 --dry-run --Werror lib/unit.cpp' calls
    expect_packages clang-format-19 cppcheck git shellcheck
    ;;
  exclusion) # A compiler of the developer's was removed.
    echo cmake >exclusions
    if run build >shown; then
      echo "a package was removed"
      exit 1
    fi
    expect_calls
    expect_packages
    grep -qx 'cmake cannot be installed beside gcc-aarch64-linux-gnu' said
    grep -q '^run: nothing was installed and nothing removed' said
    ;;
  without) # One that only adds to the tests excludes something.
    printf '%s\n' gcc-multilib >exclusions
    { run test unit || :; } >shown # there are no tests
    grep -qx 'cmake --build --preset tests' calls
    grep -qx g++-multilib packages
    [[ $(grep -cx gcc-multilib packages) -eq 0 ]]
    grep -qx 'going without gcc-multilib, which cannot be installed beside gcc-aarch64-linux-gnu' said
    ;;
  unknown) # Where no such compiler is made, there were no tests.
    echo gcc-multilib >unknown
    { run test unit || :; } >shown # there are no tests
    grep -qx 'cmake --build --preset tests' calls
    grep -qx g++-multilib packages
    grep -qx 'going without gcc-multilib, which apt cannot install' said
    sed 's/$/ all installed/' packages >installed
    touch offline # each run had fetched apt's lists again, since that one was missing
    { run test unit || :; } >shown
    grep -qx 'going without gcc-multilib, which apt cannot install' said
    [[ $(grep -c 'could not' said) -eq 0 ]]
    ;;
  offline) # One package that only adds to the tests was missing, and ended them.
    { run test unit || :; } >shown # there are no tests
    grep -vx musl-tools packages | sed 's/$/ all installed/' >installed
    touch offline
    { run test unit || :; } >shown
    grep -qx 'cmake --build --preset tests' calls
    grep -qx 'going without musl-tools' said
    ;;
  processors) # A library that was there for two processors was fetched again each time.
    command_from bin/dpkg <<<'echo amd64'
    for name in "${building[@]}"; do printf '%s arm64 installed\n%s amd64 installed\n' "$name" "$name"; done >installed
    run build
    expect_packages
    for name in "${building[@]}"; do printf '%s arm64 installed\n' "$name"; done >installed
    run build
    expect_packages "${building[@]}"
    ;;
  unversioned) # Nothing was looked at, and nothing found.
    rm -r .git
    { run test lint && exit 1; } >shown
    grep -q '^run: there are no sources' said
    { run test style && exit 1; } >shown
    grep -q ' 0 passed  *7 failed' said
    ;;
  scenario) # The list was piped into a search that ended at the first name, which failed the list.
    run lab a-scan
    expect_calls 'cmake --preset release' 'cmake --build --preset lab' 'lab run a-scan'
    run lab a-scan b-join
    grep -qx 'lab run a-scan b-join' calls
    run lab run -v b-join
    grep -qx 'lab run -v b-join' calls
    run lab
    grep -qx 'lab run' calls
    ;;
  list) # A build was made first.
    run lab list
    expect_calls
    expect_packages
    grep -q '^b-join ' said
    ;;
  everywhere)
    run everywhere -k new
    expect_calls 'everywhere build/everywhere -k new'
    expect_packages arch-test e2fsprogs git mmdebstrap
    sort build/everywhere/packages | grep -qx 'any cmake'
    grep -qx 'amd64 qemu' build/everywhere/packages
    grep -qx 'lib/unit.cpp' build/everywhere/files
    [[ $(grep -c '^build/' build/everywhere/files) -eq 0 ]]
    expect_sources '-+'
    git add run && git -c user.name=me -c user.email=me@example.org commit --quiet -m 'A first one'
    commit=$(git rev-parse --short=7 HEAD)
    run everywhere new
    expect_sources "$commit+"
    echo 'What grows here is not of the sources.' >.git/info/exclude && echo '*' >>.git/info/exclude
    run everywhere new
    expect_sources "$commit"
    touch tests/everywhere/seen.tsv && git add -f tests/everywhere/seen.tsv
    run everywhere new
    expect_sources "$commit"
    : >calls
    # Two at a time had the same systems, sources and results.
    if (flock 9 && run everywhere) 9>build/everywhere/lock; then exit 1; fi
    expect_calls
    grep -qx 'run: the tests are run in build/everywhere already, by another process' said
    # Packages were installed for a text that is printed.
    for option in -h --help -t; do
      run everywhere "$option"
      expect_calls "everywhere build/everywhere $option"
      expect_packages
    done
    ;;
  coverage)
    run coverage
    expect_calls 'cmake --preset coverage' 'cmake --build --preset coverage' 'coverage build/coverage'
    grep -qx gcovr packages
    run coverage --help
    expect_calls 'coverage build/coverage --help'
    ;;
  fuzz)
    mkdir -p build/sanitized build/fuzz
    echo 'MERO_SANITIZE:BOOL=ON' >build/sanitized/CMakeCache.txt
    { run test fuzz || :; } >shown # something was found
    expect_calls 'cmake --preset asan' 'cmake --build --preset fuzz' 'fuzz build/sanitized build/fuzz'
    grep -qxE 'fuzz +[0-9]+ s +1 passed +1 failed +0 skipped' said
    grep -qx clang packages
    { run fuzz rows 5 || :; } >shown
    expect_calls 'cmake --preset asan' 'cmake --build --preset fuzz' 'fuzz build/sanitized build/fuzz rows 5'
    { run fuzz --help || :; } >shown
    expect_calls 'fuzz build/sanitized build/fuzz --help'
    expect_packages
    ;;
  skipped) # That a test was skipped was told, and not why.
    command_from bin/ctest <<'END'
mkdir -p build/Testing/Temporary
{
  printf '%s\n' '1/3 Testing: unit.A' '1/3 Test: unit.A' 'Output:' 'first' '' 'a.cpp:7: Skipped' 'there is no air' '' 'foot'
  printf '%s\n' '<end of output>' 'Test Passed.' '2/3 Test: unit.B' 'Output:' 'first' 'there is no sea' '<end of output>'
  printf '%s\n' 'Test Passed.' '3/3 Test: unit.C' 'Output:' 'last' '<end of output>'
} >build/Testing/Temporary/LastTest.log
printf '%s\n' '1/3 Test #1: unit.A ...***Skipped   0.01 sec' '2/3 Test #12: unit.B ...***Skipped   0.01 sec' \
  '3/3 Test #3: unit.C ...   Passed   0.01 sec' '100% tests passed, 0 tests failed out of 3'
END
    run test unit
    grep '^skipped: ' said | diff - <(printf 'skipped: unit.%s\n' 'A: there is no air' 'B: there is no sea')
    grep -qxE 'unit +[0-9]+ s +1 passed +0 failed +2 skipped' said
    ;;
  foreign) # The tests ended where the lab cannot be, without a summary.
    command_from bin/dpkg <<<'echo arm64'
    command_from bin/ctest <<<'echo "100% tests passed, 0 tests failed out of 3"'
    mkdir -p build/{fuzz,sanitized,Testing/Temporary} build/sanitized/Testing/Temporary
    touch build/{,sanitized/}Testing/Temporary/LastTest.log
    echo 'MERO_SANITIZE:BOOL=ON' >build/sanitized/CMakeCache.txt
    { run test || :; } >shown # there is nothing for the style to look at
    sed -nE 's/^([a-z]+) +[0-9]+ s .*/\1/p' said | diff <(printf '%s\n' style lint unit platform asan fuzz) -
    grep -qx 'leaving out the lab, whose machines are those of amd64' said
    ;;
  cross)
    run package --arch armhf
    expect_calls 'cross package armhf build/packages-armhf with lib/unit.cpp' \
      'foreign_test.sh build/packages-armhf armhf'
    expect_packages binutils dpkg-dev git mmdebstrap
    touch wrong
    if run package --arch armhf >shown; then
      echo "packages that are not right are no failure"
      exit 1
    fi
    for wrong in '--arch' '--arch ../lib' '--arch amd64' '--arch arm64 armhf' '--architecture arm64'; do
      read -ra words <<<"$wrong"
      if run package "${words[@]}" >shown; then
        echo "package takes $wrong"
        exit 1
      fi
      [[ ! -s calls && ! -s packages && -e lib/unit.cpp ]]
    done
    ;;
  package) # dpkg-buildpackage wants of Debian's own compilers what a newcomer's system has not.
    # shellcheck disable=SC2016  # for the shell of the command
    command_from bin/dpkg-buildpackage <<<'echo "dpkg-buildpackage in ${PWD##*/}" >>../../../calls'
    command_from bin/lintian <<<'exit 0'
    run package
    expect_calls 'dpkg-buildpackage in source'
    expect_packages "${building[@]}" build-essential debhelper dpkg-dev git lintian
    ;;
  arguments)
    for name in build demo docs format lint package; do
      if run "$name" tests >shown; then
        echo "$name takes an argument"
        exit 1
      fi
      [[ ! -s calls && ! -s packages ]]
    done
    ;;
esac
