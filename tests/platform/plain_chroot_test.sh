#!/bin/sh
# plain_chroot_test.sh PROGRAM TEST
#
# A test's private machine can be made where "/" is a directory that somebody has changed to (chroot), and no mount
# point. Nobody outside sees it: the directory stands among mounts that are shared with other namespaces, as they are on
# a machine that systemd has started. "/" was taken for a mount point, and no test could run there.
set -eu

if [ "$#" -eq 2 ]; then
	[ "$(id -u)" -ne 0 ] || exec unshare --mount "$0" "$@" inside
	exec unshare --mount --map-root-user "$0" "$@" inside
fi

mount -t tmpfs shared /mnt
mount --make-shared /mnt
mkdir /mnt/plain
cd /mnt/plain
for entry in /*; do
	if [ -L "$entry" ]; then
		cp -P "$entry" .
	elif [ -d "$entry" ]; then
		mkdir ".$entry"
		[ "$entry" = /mnt ] || mount --rbind "$entry" ".$entry"
	fi
done
before=$(cat /proc/self/mountinfo)
chroot . "$1" --gtest_filter="$2" | tee ran
grep -q '^\[  PASSED  \] 1 test' ran
[ "$(cat /proc/self/mountinfo)" = "$before" ]
