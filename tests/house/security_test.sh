#!/bin/bash
# security_test.sh CASE: what SECURITY.md says is held by tests.
#
#   statements   each statement has tests, or the reason why there is none, and each of these tests exists
#   noticed      a statement without them, one that is no more, and a test that there is not are noticed
#   rights       nothing of the system changes whose rights it has
set -euo pipefail
here=$(dirname "$(realpath "$0")")
top=$(realpath "$here/../..")
readonly here top

# What is said, and what is held.
said() { awk -f "$here/statements.awk" "$1" | LC_ALL=C sort -u; } # DOCUMENT
held() { grep -v '^#' "$1" | grep -vE $'^(\t|$)' | LC_ALL=C sort -u; } # LIST

# Statements without a test or a reason, and those that are held twice.
without() { # LIST
  awk '/^#/ || /^$/ { next }
    /^\t/ { tests[statement]++; next }
    { statement = $0; if (seen[statement]++) print "twice: " statement }
    END { for (statement in seen) if (!tests[statement]) print "nothing holds: " statement }' "$1"
}

readonly request='on request: '

tests_of() { grep -E $'^\t[^-]' "$1" | sed "s/^\t$request/\t/" | tr -s '\t ' '\n' | grep . | sort -u; } # LIST

# Those that `./run test` does not run unless it is asked to, where it does not say so.
not_by_default() { # LIST
  local scenario names=package
  while read -r scenario; do
    names+="|lab\\.$(basename -s .sh "$scenario")"
  done < <(grep -lE '^# (Debian|On request)$' "$top"/tests/lab/scenarios/*.sh)
  grep -E $'^\t' "$1" | grep -v "$request" | grep -oE "(^|[[:space:]])($names)(\.\w+)?( |\$)" || :
}

all_tests() {
  grep -rhoE '^TEST(_F|_P)?\(\w+, *\w+' "$top/tests" | sed -E 's/^TEST\w*\((\w+), *(\w+)/\1.\2/'
  # A fixture may have another name where its tests are.
  grep -rhoE '\b[A-Z]\w+\.[A-Z]\w+' "$top"/tests/*/CMakeLists.txt
  basename -a -s .sh "$top"/tests/lab/scenarios/*.sh | sed 's/^/lab./'
  basename -a "$top"/tests/fuzz/seeds/* | sed 's/^/fuzz./'
  grep -hoE "^  check .* \w+" "$top/tests/package/package_test.sh" | sed 's/.* /package./'
}

unheld() { # DOCUMENT LIST
  diff <(said "$1") <(held "$2") | sed -n 's/^</not held:/p; s/^>/not said:/p'
  without "$2"
  comm -23 <(tests_of "$2") <(all_tests | sort -u) | sed 's/^/no such test: /'
  not_by_default "$2" | sed -E 's/^\s*/on request alone: /'
}

expect() { # WHAT-IS-FOUND CHANGE
  local document=$work/document list=$work/list found
  cp "$top/SECURITY.md" "$document"
  cp "$here/security" "$list"
  sed -i "$2" "$document" "$list"
  found=$(unheld "$document" "$list")
  [[ $found == "$1"* ]] || { printf 'not noticed: %s\nfound: %s\n' "$2" "$found" && return 1; }
}

case ${1-} in
  statements) unheld "$top/SECURITY.md" "$here/security" | diff /dev/null - ;;
  noticed)
    work=$(mktemp -d)
    trap 'rm -r "$work"' EXIT
    expect 'not held: Guests may do what they like.' 's/^# Security$/&\n\nGuests may do what they like./'
    expect 'not said: Guests may not.' 's/^settings: Believed\.$/Guests may not.\n\t- nobody\n&/'
    expect 'nothing holds: guests of the access point: Their rules' '/HasItsRulesBeforeItIsOnTheAir/d'
    expect 'no such test: KitAccessPoint.HasNoRules' 's/HasItsRulesBeforeItIsOnTheAir/HasNoRules/'
    expect 'on request alone: lab.power-cuts-all' 's/on request: \(lab.power\)/\1/'
    expect 'on request alone: package.' 's/on request: \(package\)/\1/'
    expect 'no such test: lab.nowhere' 's/lab\.wrong-passphrase/lab.nowhere/'
    ;;
  rights)
    cd "$top"
    change='set(re|res|fs|e)?[ug]id|(init|set)groups|capset|cap_set_proc|setcap|sudo|su|runuser|setpriv|[ug]\+s'
    change+='|SYS_(set|cap)[a-z]+|SETU?G?ID|(chmod|-m) (-R )?[0-7]?[2-7][0-7]{3}'
    found=0
    grep -rnwE -e "$change" lib platform common tools appliance debian --exclude=changelog || found=$?
    [[ $found -eq 1 ]] # 0 when there is one, 2 when they could not be looked at
    ;;
  *)
    sed -n '2,/^set/s/^# \?//p' "$0" >&2
    exit 2
    ;;
esac
