# Debian systems that the tests are run in, with all that they need. Sourced by scripts of bash, with `set -euo pipefail`;
# in `here` their directory, beside tests/support; and in `work` the directory in which ./run leaves the sources, as
# `source.tar`, and which packages of Debian's it needs for what, as `packages`.
# shellcheck shell=bash
# shellcheck disable=SC2154  # what the scripts set

# shellcheck source=tests/support/debian.sh
. "$here/../support/debian.sh"

# The system of a suite and of a processor whose programs this machine runs.
tests_root() { # SUITE PROCESSOR
  local packages
  mapfile -t packages < <(sed -nE "s/^(any|$2) //p" "$work/packages")
  debian_root "$work/roots" tests "$1" "$2" ccache clang git "${packages[@]}"
}

# How builds there keep what they have compiled, for `env`.
# shellcheck disable=SC2034  # for the scripts
readonly -a kept_compilations=(CCACHE_DIR=/srv/ccache CMAKE_C_COMPILER_LAUNCHER=ccache CMAKE_CXX_COMPILER_LAUNCHER=ccache
  "CCACHE_SLOPPINESS=pch_defines,time_macros,include_file_mtime,include_file_ctime")

# Runs a command in a system, among the sources. What is written to /srv/row there is in the directory.
among_sources() { # ROOT DIRECTORY COMMAND...
  mkdir -p "$work/ccache"
  # shellcheck disable=SC2016  # for the shell inside
  in_debian "$1" -b "$2" /srv/row -b "$work/ccache" /srv/ccache \
    bash -c 'mkdir /root/merowireless && cd /root/merowireless && tar --extract --no-same-owner && git init --quiet && "$@"' \
    sources "${@:3}" <"$work/source.tar"
}
