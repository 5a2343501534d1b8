#!/bin/bash
# lab_test.sh CASE
#
# What the lab promises of its work on the host. Its functions are those of `lab`; no machine runs.
set -euo pipefail
scratch=$(mktemp -d)
trap 'rm -r "$scratch"' EXIT
export MERO_BUILD=$scratch/build MERO_LAB_DEBIAN=trixie
case $1 in
  foreign-*)
    MERO_LAB_ARCH=$(dpkg --print-architecture | sed 's/arm64/amd64/; t; s/.*/arm64/')
    export MERO_LAB_ARCH
    ;;
esac
# shellcheck source=tests/lab/lab
. "$(dirname "$(realpath "$0")")/lab" list >/dev/null

case $1 in
  lists) # apt-get ended with 0 when it could reach nothing, and the lab said that apt does not know the kernel.
    debian_archives() { echo "deb [trusted=yes] http://127.0.0.1:9 $1 main"; }
    declare -a suite_options
    if (find_archives) 2>"$scratch/said"; then exit 1; fi
    grep -q "^lab: the lists of Debian's archives (trixie) could not be fetched$" "$scratch/said"
    ;;
  *)
    echo "there is no case $1"
    exit 2
    ;;
esac
