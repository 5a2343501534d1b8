#!/bin/sh
# awk_test.sh
#
# The manual, the list of messages and that of statements are the same whichever awk makes them: of those that a Debian
# machine may call awk, all that there are here. At least busybox's is, beside the machine's own. It once took a brace
# for a repetition, and one that is newer left backslashes out of the manual.
set -eu
export LC_ALL=C
source=$(dirname "$(realpath "$0")")/../..
work=$(mktemp -d)
trap 'rm -r "$work"' EXIT

make_all() { # DIRECTORY
	"$source/docs/man/make_pages.sh" "$source" "$1/pages"
	awk -v shell=1 -f "$source/tests/house/messages.awk" "$source"/appliance/lib/*.sh >"$1/of-shell"
	awk -f "$source/tests/house/messages.awk" "$source"/lib/obsolete/*.cpp "$source"/tools/*/*.cpp >"$1/of-sources"
	awk -f "$source/tests/house/statements.awk" "$source/SECURITY.md" >"$1/statements"
	[ -s "$1/of-shell" ] && [ -s "$1/of-sources" ] && [ -s "$1/statements" ]
}

mkdir "$work/own" "$work/bin"
make_all "$work/own"
for other in 'busybox awk' mawk gawk original-awk; do
	command -v "${other%% *}" >/dev/null || continue
	mkdir "$work/other"
	printf '#!/bin/sh\nexec %s "$@"\n' "$other" >"$work/bin/awk"
	chmod +x "$work/bin/awk"
	(PATH=$work/bin:$PATH && make_all "$work/other")
	diff -r "$work/own" "$work/other" || { echo "$other makes something else" && exit 1; }
	rm -r "$work/other"
done
