#!/bin/bash
# mutants_test.sh CASE
#
# How the project is broken, and what comes of it: in a house of its own, whose builds and tests are told what to say.
# shellcheck disable=SC2016  # what programs and sources are made of
set -euo pipefail
mutants=$(realpath "$(dirname "$0")")
house=$(mktemp -d)
trap 'rm -r "$house"' EXIT
cd "$house"

program() { # NAME SCRIPT
  mkdir -p "${1%/*}"
  printf '#!/bin/bash\n%s\n' "$2" >"$1"
  chmod 755 "$1"
}

# A build does not know `!=`; the tests notice what is not true, and the scenario what is 3.
make_house() {
  mkdir -p lib appliance/lib tests/{mutants,everywhere,support,lab} results
  cp "$mutants"/{mutants,inside,breakages} tests/mutants
  cp "$mutants/../everywhere/systems.sh" tests/everywhere
  printf 'bool Is(int a) {\n  if (a == 1) return true;\n  return false;\n}\n' >lib/is.cpp
  printf '# wait: a moment\nwait() {\n\tsleep 2\n}\n' >appliance/lib/wait.sh
  printf 'appliance/lib/wait.sh long\n' >tests/mutants/scenarios
  printf '# none\n' >tests/mutants/equivalent
  program bin/cmake 'echo "cmake $*" >>calls; [[ $1 != --build ]] || ! grep -q "!=" lib/is.cpp'
  program bin/ctest 'cat lib/is.cpp >>seen; [[ $(grep -c true lib/is.cpp) -eq 1 ]] || { printf "\t 7 - unit.Is.So (Failed)\n" && exit 8; }'
  program tests/lab/lab 'echo "lab $*" >>calls; ! grep -q "sleep 3" appliance/lib/wait.sh'
  cat >tests/support/debian.sh <<'END'
debian_suite() { echo bookworm; }
debian_root() { echo root; }
in_debian() {
  local row=$3
  shift 7
  set -- "${@//\/srv\/row/"$row"}"
  (cd "$(mktemp -d -p "$work")" && "${@//\/root/.}")
}
END
  PATH=$house/bin:$PATH
}

case $1 in
  cpp)
    cat >one.cpp <<'END'
#include <a == b>
  if (a == b && !c) return "x < 1";  // a > b
  g_count = 0;
  std::vector<int> v(12, 'x' + 0x10);
  Close(file);
  while (n - 1 >= 2) n += 1;
END
    "$mutants/breakages" one.cpp | cut -f 2- | diff <(tr '~' '\t' <<'END'
2~comparison~  if (a != b && !c) return "x < 1";  // a > b
2~connective~  if (a == b || !c) return "x < 1";  // a > b
2~negation~  if (a == b && c) return "x < 1";  // a > b
3~number~  g_count = 1;
3~dropped~  ;
4~sum~  std::vector<int> v(12, 'x' - 0x10);
4~number~  std::vector<int> v(13, 'x' + 0x10);
5~dropped~  ;
6~comparison~  while (n - 1 > 2) n += 1;
6~sum~  while (n + 1 >= 2) n += 1;
6~number~  while (n - 2 >= 2) n += 1;
6~number~  while (n - 1 >= 3) n += 1;
6~number~  while (n - 1 >= 2) n += 2;
END
    ) -
    ;;
  sh)
    printf '%s\n' '#!/bin/sh' 'one() { # a = b' $'\tif [ "$a = b" = c ] && ! d; then return 1; fi' $'\tip link set "$1" up' \
      $'\trm -f \\' $'\t\tfile' $'\tsleep 5' '}' >one.sh
    "$mutants/breakages" one.sh | cut -f 2- | diff <(printf '%s\n' \
      $'3\tcomparison\t\tif [ "$a = b" != c ] && ! d; then return 1; fi' \
      $'3\tconnective\t\tif [ "$a = b" = c ] || ! d; then return 1; fi' \
      $'3\tnegation\t\tif [ "$a = b" = c ] && d; then return 1; fi' \
      $'3\tstatus\t\tif [ "$a = b" = c ] && ! d; then return 0; fi' \
      $'3\tnumber\t\tif [ "$a = b" = c ] && ! d; then return 2; fi' \
      $'4\tdropped\t\t:' $'7\tnumber\t\tsleep 6' $'7\tdropped\t\t:') -
    ;;
  noticed) # and what does not compile is not counted
    make_house
    find lib appliance tests -type f | tar --create --file results/source.tar --files-from -
    : >results/packages
    if tests/mutants/mutants "$house/results" -s 1 99 >said 2>progress; then exit 1; fi
    for part in lib appliance; do diff -r "$(echo results/tmp.*)/merowireless/$part" "$part"; done
    sed -n '1,/^$/s/  */ /gp' said | diff <(printf '%s\n' ' broken noticed share' 'lib 3 2 67%' 'kit, scripts 2 1 50%' \
      'together 5 3 60%') -
    sed '1,/^not noticed:$/d; s/:[ \t]\+/: /g' said | sort | diff <(printf '%s\n' 'appliance/lib/wait.sh:3: dropped: :' 'lib/is.cpp:2: number: if (a == 2) return true;') -
    cut -f 5 results/mutants/results | sort | uniq -c | sed 's/^ *//' | diff - <(printf '%s\n' '2 ' '1 scenario long' '2 unit.Is.So')
    ;;
  equivalent)
    make_house
    printf 'lib/is.cpp\tif (a == 2) return true;\tit is the same\n' >>tests/mutants/equivalent
    find lib tests -type f | tar --create --file results/source.tar --files-from -
    : >results/packages
    tests/mutants/mutants "$house/results" 99 >said 2>progress
    [[ $(grep -c 'a == 2' results/mutants/results) -eq 0 && $(wc -l <results/mutants/results) -eq 2 ]]
    ;;
  failing) # Everything would have been noticed.
    make_house
    find lib tests -type f | tar --create --file results/source.tar --files-from -
    : >results/packages
    program bin/ctest 'printf "\t 7 - unit.Is.So (Failed)\n"; exit 8'
    if tests/mutants/mutants "$house/results" 1 >said 2>progress; then exit 1; fi
    grep -qx 'nothing is broken, and unit.Is.So fails' progress
    ;;
esac
