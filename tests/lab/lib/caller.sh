# The program that makes the calls: mero-call, which calls the library's functions, or program-call, which runs the
# management program.
# shellcheck shell=bash

# through_functions: true when the calls go to the library's functions, and false when the program is run instead, for
# the places where it does otherwise on purpose.
through_functions() {
  [[ ! $LAB_PROGRAM ]]
}
