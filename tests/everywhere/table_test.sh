#!/bin/sh
# table_test.sh
#
# The table of where the tests are run has a line for each level of each row, tells what failed and what was skipped, and
# names the rows that have not been run; and the page of it holds what is kept of the last runs.
set -eu
here=$(dirname "$(realpath "$0")")
work=$(mktemp -d)
trap 'rm -r "$work"' EXIT

cat >"$work/rows" <<'END'
old bookworm i386 gcc,g++ - build,unit
new trixie amd64 clang,clang++ -O3 unit
next trixie arm64 gcc,g++ - unit
END
{
	printf 'new\ttrixie\tamd64\tclang,clang++\t-O3\tunit\t10\t1\t2\t33\tfailed: unit.A.B|skipped: unit.C.D: there is no air\t2026-01-02\tabcdef0+\n'
	printf 'old\tbookworm\ti386\tgcc,g++\t-\tbuild\t1\t0\t0\t200\t\t2026-01-01\tabcdef0\n'
	printf 'old\tbookworm\ti386\tgcc,g++\t-\tunit\t12\t0\t1\t40\tskipped: unit.C.D: there is no air\t2026-01-01\tabcdef0\n'
} >"$work/results"

cat >"$work/expected" <<'END'
| row | system | processor | compiler | level | passed | failed | skipped | s | day | commit |
| --- | --- | --- | --- | --- | --- | --- | --- | --- | --- | --- |
| old | Debian 12 | i386 | gcc | build | 1 | 0 | 0 | 200 | 2026-01-01 | abcdef0 |
| old | Debian 12 | i386 | gcc | unit | 12 | 0 | 1 (1) | 40 | 2026-01-01 | abcdef0 |
| new | Debian 13 | amd64 | clang -O3 | unit | 10 | **1** (2) | 2 (1) | 33 | 2026-01-02 | abcdef0+ |
| next | Debian 13 | arm64 | gcc | not run yet | - | - | - | - | - | - |

1. unit.C.D: there is no air
2. unit.A.B
END
awk -f "$here/table.awk" "$work/rows" "$work/results" | diff -u "$work/expected" -

# Lines that were seen of another row than there is, which was so before its words were changed.
strangers() { # ROWS RESULTS
	awk 'FNR == NR { row[$1 "\t" $2 "\t" $3 "\t" $4 "\t" $5]; next }
		{ split($0, f, "\t") }
		!((f[1] "\t" f[2] "\t" f[3] "\t" f[4] "\t" f[5]) in row) { print "there is no such row (any more): " $0 }' "$1" "$2"
}
[ ! "$(strangers "$work/rows" "$work/results")" ]
sed '/^next/d; s/-O3/-O2/' "$work/rows" >"$work/changed"
[ "$(strangers "$work/changed" "$work/results" | wc -l)" -eq 1 ]
sed '/^old/d' "$work/rows" >"$work/changed"
[ "$(strangers "$work/changed" "$work/results" | wc -l)" -eq 2 ]
strangers "$here/rows" "$here/seen.tsv" | diff /dev/null -

# The level of the sanitizers is built by clang whatever a row says.
awk '/^[^#]/ && $6 ~ /asan/ && $4 !~ /^clang,/ { print; wrong = 1 } END { exit wrong }' "$here/rows"

# The page of it.
"$here/everywhere" "$work" -t >"$work/expected"
sed -n '/^| row |/,$p' "$here/../../docs/everywhere.md" | diff -u "$work/expected" -
