#!/bin/sh
# checks_test.sh OFFENCE
#
# Makes a small house, in which the checks of names, paths and messages find nothing, and commits the offence in it,
# which its check finds.
# shellcheck disable=SC2016,SC2086  # values stand in sources; a check has words
set -eu
checks=$(dirname "$(realpath "$0")")
house=$(mktemp -d)
trap 'rm -rf "$house"' EXIT
cd "$house"

git init -q
mkdir -p tests/house tests/unit tests/platform tests/appliance tests/tools common lib/obsolete platform/core \
  tools/model appliance/etc appliance/hotplug appliance/lib appliance/sbin
cp "$checks"/data_flow* "$checks/unit_names" "$checks/paths" "$checks/draw-messages" "$checks/messages.awk" tests/house
touch common/log.h appliance/sbin/udhcpc.lease
echo 'bool Spin() { return LOG("Failed to spin %s", "/etc/top"), false; }' >lib/obsolete/top.cpp
echo 'TEST(Top, Spins) { Expect("Failed to spin /etc/top"); }' >tests/unit/top_test.cpp
echo 'int Turn() { return FAIL(errno, "Failed to turn %s", kDisk), -1; }' >platform/core/disk.cpp
echo 'TEST(Disk, Turns) { Expect("Failed to turn /etc/disk: No such device"); }' >tests/platform/disk_test.cpp
echo 'void Look() { throw Wrong("there is no such thing", "give another"); }' >tools/model/things.cpp
echo 'TEST(Things, AreThere) { Expect("there is no such thing"); }' >tests/tools/things_test.cpp
echo 'constexpr char kDisk[] = "/etc/disk";' >common/paths.h
printf 'directory=/var/run/parts\nbegin() {\n\tfail "cannot begin $1"\n}\n' >appliance/lib/parts.sh
echo 'TEST(Kit, Begins) { Expect("cannot begin br0"); }' >tests/appliance/kit_test.cpp
for check in data_flow unit_names paths 'draw-messages all'; do tests/house/$check >/dev/null; done

case $1 in
  unit) # in a directory that is new, and in one that reports through others
    mkdir platform/extra
    touch platform/extra/disk.cpp platform/core/log.cpp
    check=unit_names
    expected='common/log and platform/core/log bear one name
platform/core/disk and platform/extra/disk bear one name'
    ;;
  path) # as such, at the beginning of a longer one, and in the script that stands by itself
    echo 'const char* szDisk = "/etc/disk/";' >>tools/model/things.cpp
    printf 'pid=/var/run/parts/pid\nlog=/var/run/lease.log\n' >>appliance/etc/rc.network
    echo 'lock=/var/run/lease' >appliance/sbin/udhcpc.lease
    echo 'lease=/var/run/lease-lo' >>appliance/lib/parts.sh
    check=paths
    expected='/etc/disk is spelled more than once
/var/run/lease is spelled more than once
/var/run/parts is spelled more than once'
    ;;
  flow) # to where it is nothing
    echo 'int Get(const int* at) { int value = *at; return at ? value : 0; }' >>lib/obsolete/top.cpp
    check=data_flow
    expected='lib/obsolete/top.cpp:2: nullPointerRedundantCheck'
    ;;
  verb) # put together from a verb and what it is about
    echo 'int Stop() { return FAIL(errno, "Failed to %s %s", "turn", kDisk), -1; }' >>platform/core/disk.cpp
    check='draw-messages all'
    expected='platform/core/disk.cpp:2: "Failed to ... ..." has a value for its verb;'
    ;;
  elsewhere) # made elsewhere, and passed on
    echo 'bool Tell() { return LOG("%s", kText), false; }' >>lib/obsolete/top.cpp
    echo 'void Say() { syslog(LOG_ERR, "%s", szText); }' >>lib/obsolete/top.cpp
    check='draw-messages all'
    expected='lib/obsolete/top.cpp:2: "..." has too few words to be searched for;
lib/obsolete/top.cpp:3: "..." has too few words to be searched for;'
    ;;
  untested) # by its own unit, whatever the tests of others say; and in a line that goes on
    echo 'int Spin() { return FAIL(errno, "Failed to turn %s", kDisk), -1; }' >platform/core/wheel.cpp
    printf 'end() {\n\tfail \\\n\t\t"cannot end $1"\n}\n' >>appliance/lib/parts.sh
    check='draw-messages all'
    expected='appliance/lib/parts.sh:6: "cannot end ..." is in no test;
platform/core/wheel.cpp:1: "Failed to turn ..." is in no test;'
    ;;
  twice)
    echo 'void Find() { throw Wrong("there is no such thing", "give another"); }' >tools/model/more.cpp
    check='draw-messages all'
    both='"there is no such thing" is found in tools/model/more.cpp and tools/model/things.cpp;'
    expected="tools/model/more.cpp:1: $both
tools/model/things.cpp:1: $both"
    ;;
esac

if tests/house/$check >/dev/null 2>found; then
  echo "the offence is not found"
  exit 1
fi
sed -i 's/\(: nullPointer[A-Za-z]*\): .*/\1/' found # in whatever words
printf '%s\n' "$expected" | diff - found
