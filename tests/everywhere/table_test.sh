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
	printf 'new\tunit\t10\t1\t2\t33\tfailed: unit.A.B|skipped: unit.C.D: there is no air\t2026-01-02\n'
	printf 'old\tbuild\t1\t0\t0\t200\t\t2026-01-01\n'
	printf 'old\tunit\t12\t0\t1\t40\tskipped: unit.C.D: there is no air\t2026-01-01\n'
} >"$work/results"

cat >"$work/expected" <<'END'
| row | system | processor | compiler | level | passed | failed | skipped | s | day |
| --- | --- | --- | --- | --- | --- | --- | --- | --- | --- |
| old | Debian 12 | i386 | gcc | build | 1 | 0 | 0 | 200 | 2026-01-01 |
| old | Debian 12 | i386 | gcc | unit | 12 | 0 | 1 (1) | 40 | 2026-01-01 |
| new | Debian 13 | amd64 | clang -O3 | unit | 10 | **1** (2) | 2 (1) | 33 | 2026-01-02 |
| next | Debian 13 | arm64 | gcc | not run yet | - | - | - | - | - |

1. unit.C.D: there is no air
2. unit.A.B
END
awk -f "$here/table.awk" "$work/rows" "$work/results" | diff -u "$work/expected" -

# The page of it.
"$here/everywhere" "$work" -t >"$work/expected"
sed -n '/^| row |/,$p' "$here/../../docs/everywhere.md" | diff -u "$work/expected" -
