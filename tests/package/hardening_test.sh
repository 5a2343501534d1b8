#!/usr/bin/env bash
# hardening_test.sh COMPILER: what a program of that compiler lacks is noticed.
set -euo pipefail
here=$(dirname "$(realpath "$0")")
readonly here compiler=$1
work=$(mktemp -d)
trap 'rm -r "$work"' EXIT

cat >"$work/program.c" <<'END'
#include <string.h>

void (*volatile used)(char*);

#define FUNCTION(name) \
  void name(char* text) { text[0] = 0; }
FUNCTION(f0) FUNCTION(f1) FUNCTION(f2) FUNCTION(f3) FUNCTION(f4) FUNCTION(f5)
FUNCTION(f6) FUNCTION(f7) FUNCTION(f8) FUNCTION(f9)

#ifdef ADDRESS  // in the code itself, so that it has to be changed when it is loaded
__asm__(".text\n\t" ADDRESS " main\n");
#endif

int main(int count, char** words) {
  char copy[16];
  strcpy(copy, words[count - 1]);
  if (used) used(copy);
  return 0;
}
END

readonly options=(-O2 -U_FORTIFY_SOURCE -D_FORTIFY_SOURCE=2 -fstack-protector-strong -fPIE -pie '-Wl,-z,relro'
  '-Wl,-z,now' '-Wl,-z,noexecstack')

build() { "$compiler" "${options[@]}" "$@" -w "$work/program.c" -o "$work/program" 2>/dev/null; } # OPTION...

expect() { # WHAT-IS-FOUND OPTION...
  local wanted=$1
  shift
  build "$@"
  expect_found "$wanted" "$*"
}

expect_found() { # WHAT-IS-FOUND HOW
  local found
  found=$("$here/hardening" ${control_flow:+"$control_flow"} "$work/program" || :)
  [[ ${found#"$work/program has no "} == "$1" ]] || { printf '%s: %s\n' "$2" "$found" >&2 && exit 1; }
}

expect ''
expect 'addresses that nobody can guess' -fno-PIE -no-pie
expect 'tables that cannot be written to' -Wl,-z,norelro
expect 'names that are looked up before it runs' -Wl,-z,lazy
expect 'memory that is either written to or run' -Wl,-z,execstack
word=.quad
! "$compiler" -dM -E -x c /dev/null | grep -q '__SIZEOF_POINTER__ 4' || word=.long
expect 'code that stays as it is' "-DADDRESS=\"$word\"" -Wl,-z,notext
build
LC_ALL=C sed -i 's/\x51\xe5\x74\x64/\x00\x00\x00\x00/' "$work/program" # the mark of the stack's segment
expect_found 'a word about the stack' 'without a segment of the stack'
expect 'libraries that come from the system alone' -Wl,-rpath,/nowhere
expect 'a guard of the stack' -fno-stack-protector
expect 'checks of lengths' -U_FORTIFY_SOURCE

case $("$compiler" -dumpmachine) in
  x86_64-* | i?86-*)
    control_flow=--control-flow
    expect '' -fcf-protection=full
    expect 'marks where indirect calls may lead' -fcf-protection=none
    ;;
esac
