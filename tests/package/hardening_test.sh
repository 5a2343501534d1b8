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

int main(int count, char** words) {
  char copy[16];
  strcpy(copy, words[count - 1]);
  if (used) used(copy);
  return 0;
}
END

readonly options=(-O2 -U_FORTIFY_SOURCE -D_FORTIFY_SOURCE=2 -fstack-protector-strong -fPIE -pie '-Wl,-z,relro'
  '-Wl,-z,now' '-Wl,-z,noexecstack')

expect() { # WHAT-IS-FOUND OPTION...
  local found wanted=$1
  shift
  "$compiler" "${options[@]}" "$@" -w "$work/program.c" -o "$work/program"
  found=$("$here/hardening" ${control_flow:+"$control_flow"} "$work/program" || :)
  [[ ${found#"$work/program has no "} == "$wanted" ]] || { printf '%s: %s\n' "$*" "$found" >&2 && exit 1; }
}

expect ''
expect 'addresses that nobody can guess' -fno-PIE -no-pie
expect 'tables that cannot be written to' -Wl,-z,norelro
expect 'names that are looked up before it runs' -Wl,-z,lazy
expect 'memory that is either written to or run' -Wl,-z,execstack
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
