#!/bin/bash
# row.sh COMPILERS OPTIONS LEVELS DIRECTORY: runs the levels of a row in the system that it is for, where the sources are the
# working directory, and leaves in the directory what came of each: a line of `results`, and all that it said. Compilers
# and levels have commas between them.
#
# A line has the level, how many tests passed, failed and were skipped, the seconds, and what failed and was skipped, with
# tabs between.
set -euo pipefail

IFS=, read -r cc cxx <<<"$1"
options=$2
IFS=, read -ra levels <<<"$3"
directory=$4
readonly cc cxx options levels directory

# Whatever the compiler is asked for comes after what the build asks for by itself, which is CMake's for its build type.
configure() { # PRESET
  local all="-O2 -g -DNDEBUG $options" flags=()
  [[ $options == - ]] || flags=(-DCMAKE_C_FLAGS_RELWITHDEBINFO="$all" -DCMAKE_CXX_FLAGS_RELWITHDEBINFO="$all"
    -DMERO_LIBRARY_OPTIONS="$options")
  cmake --preset "$1" -DCMAKE_C_COMPILER="$cc" -DCMAKE_CXX_COMPILER="$cxx" "${flags[@]}"
}

result() { # LEVEL PASSED FAILED SKIPPED SECONDS NOTES
  (IFS=$'\t' && echo "$*") >>"$directory/results"
}

# What is known of the tests of a level that failed or were skipped, by what ./run says while it tests that.
notes() { # LOG LEVEL
  sed -n "/^testing ($2)\$/,/^testing (/p" "$1" |
    sed -nE '/ \(Skipped\)/d; s/^\s+[0-9]+ - (\S+)( +# GetParam\(\) = .*)? \([^()]*\)( .*)?$/failed: \1/p
      s/^not ok /failed: /p
      /^skipped: /p' | sort -u | paste --serial --delimiters='|'
}

# The levels that ./run has told of, by its summary; or that it has told of none.
take_summary() { # LOG LEVEL SECONDS
  local level seconds passed failed skipped
  if ! grep -qE '^[a-z]+ +[0-9]+ s .* passed .* failed .* skipped$' "$1"; then
    result "$2" 0 1 0 "$3" 'failed: it came to no end'
    return
  fi
  sed -nE 's/^([a-z]+) +([0-9]+) s +([0-9]+) passed +([0-9]+) failed +([0-9]+) skipped$/\1 \2 \3 \4 \5/p' "$1" |
    while read -r level seconds passed failed skipped; do
      result "$level" "$passed" "$failed" "$skipped" "$seconds" "$(notes "$1" "$level")"
    done
}

# Whether a command succeeds, which is one test.
take_command() { # LEVEL COMMAND...
  local began=$SECONDS log=$directory/$1.log failed=0
  "${@:2}" >"$log" 2>&1 </dev/null || failed=1
  result "$1" $((1 - failed)) $failed 0 $((SECONDS - began)) ''
  return $failed
}

build() {
  configure tests && cmake --build --preset tests -- -k 0
}

# Runs ./run test, of which each level is one of the row's.
take_tests() { # NAME LEVEL...
  local began=$SECONDS log=$directory/$1.log
  ./run test "${@:2}" >"$log" 2>&1 </dev/null || :
  take_summary "$log" "$1" $((SECONDS - began))
}

CMAKE_BUILD_PARALLEL_LEVEL=$(nproc)
export CMAKE_BUILD_PARALLEL_LEVEL
for level in "${levels[@]}"; do
  case $level in
    build) take_command build build || break ;;
    readme)
      take_command demo ./run demo || :
      take_tests test
      ;;
    *) take_tests "$level" "$level" ;;
  esac
done
