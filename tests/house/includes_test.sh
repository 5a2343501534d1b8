#!/bin/sh
# includes_test.sh OFFENCE
#
# Makes a small house, in which the check of the includes finds nothing, and commits the offence in it, which it finds.
set -eu
check=$(dirname "$(realpath "$0")")/includes
house=$(mktemp -d)
trap 'rm -r "$house"' EXIT
cd "$house"

mkdir -p common include lib/obsolete platform/base tools/show tools/base appliance/sbin
echo '#include <stdio.h>' >include/wireless.h
echo '#include "wireless.h"' >common/log.h
echo '#include "common/log.h"' >platform/base/file.h
printf '%s\n' '#include "platform/base/file.h"' '#include "common/log.h"' >platform/base/file.cpp
echo >tools/base/text.h
printf '%s\n' '// What is shown.' '#include "base/text.h"' >tools/show/output.h
"$check"

case $1 in
  up) # a floor that stands above, and one that stands below and is not among those that may be included
    echo '#include "show/output.h"' >>tools/base/text.h
    echo '#  include <platform/base/file.h>' >lib/obsolete/unit.cpp
    expected='lib/obsolete/unit.cpp:1: lib/obsolete may not include platform/base (platform/base/file.h)
tools/base/text.h:2: tools/base may not include tools/show (show/output.h)
tools/show/output.h:2: closes the circle tools/base/text > tools/show/output > tools/base/text'
    ;;
  circle) # of units none of whose headers includes another
    echo '#include "platform/base/lock.h"' >>platform/base/file.cpp
    echo '#include "platform/base/edit.h"' >platform/base/lock.cpp
    echo '#include "platform/base/file.h"' >platform/base/edit.cpp
    touch platform/base/lock.h platform/base/edit.h
    expected='platform/base/lock.cpp:1: closes the circle platform/base/edit > platform/base/file > platform/base/lock >'
    expected="$expected platform/base/edit"
    ;;
  floor)
    mkdir platform/attic
    touch platform/attic/old.c platform/newer.h tools/base.hpp
    echo '#include "base.hpp"' >>tools/show/output.h
    expected='platform/attic/old.c: stands on no floor
platform/newer.h: stands on no floor
tools/show/output.h:3: tools/show may not include tools (base.hpp)'
    ;;
  nowhere)
    mkdir tests
    touch tests/ring.h platform/base/table.inc
    echo '#include "../base/text.h"' >>tools/show/output.h
    printf '#include <%s>\n' base/../show/output.h ../platform/base/file.h >>tools/base/text.h
    printf '#include <%s>\n' tests/ring.h platform/base/table.inc >>common/log.h
    expected='common/log.h:2: there is no source tests/ring.h
common/log.h:3: there is no source platform/base/table.inc
tools/base/text.h:2: there is no source base/../show/output.h
tools/base/text.h:3: there is no source ../platform/base/file.h
tools/show/output.h:3: there is no source ../base/text.h'
    ;;
esac

if "$check" >found; then
  echo "the offence is not found"
  exit 1
fi
printf '%s\n' "$expected" | diff - found
