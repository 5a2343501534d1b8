#!/bin/sh
# dependencies_test.sh READELF LIBRARY SONAME ALLOWED...
#
# The library bears its SONAME, and needs no other libraries at run time than those allowed.
set -eu
readelf=$1 library=$2 soname=$3
shift 3

entry() {
  "$readelf" --dynamic --wide "$library" | sed -n "s/.*($1).*\[\(.*\)\]$/\1/p"
}

actual=$(entry SONAME)
if [ "$actual" != "$soname" ]; then
  echo "its SONAME is '$actual', not '$soname'"
  exit 1
fi
for needed in $(entry NEEDED); do
  case " $* " in
    *" $needed "*) ;;
    *) echo "it needs $needed" && exit 1 ;;
  esac
done
