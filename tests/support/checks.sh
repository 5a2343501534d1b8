# Checks that are told of in a line each. Sourced by scripts of bash, which fail at their end if `failures` is not 0.
# shellcheck shell=bash

failures=0

check() { # TEXT COMMAND...
  local text=$1
  shift
  if "$@"; then
    echo "ok $text"
  else
    echo "not ok $text"
    failures=$((failures + 1))
  fi
}
