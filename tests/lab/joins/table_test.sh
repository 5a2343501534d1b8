#!/bin/sh
# table_test.sh
#
# The table of who joins whom tells the time of who has joined, and a reason where one has not; and the page of it holds
# what the last run has seen.
set -eu
joins=$(dirname "$(realpath "$0")")
work=$(mktemp -d)
trap 'rm -r "$work"' EXIT

line() { # ROLE PEER PROTECTION BAND NETWORK OUTCOME MILLISECONDS WORDS
	printf '%s\t%s\t%s\t%s\t%s\t%s\t%s\t%s\n' "$@"
}

{
	line client one open 2.4 main joined 1569 ''
	line client one open 2.4 guests joined 1537 ''
	line client two open 2.4 main failed '' 'of traffic, address and ping it came to: authorized'
	line client one wep 2.4 main refused '' 'not supported'
	line client one wep 5 main refused '' 'not supported'
	line client two wep 2.4 main joined 12 ''
	line point two wep 2.4 main none '' ''
} >"$work/cells"
{
	echo '# a comment'
	printf 'client\tone\topen wep\tnot supp.*\tThere is no such thing.\n'
	printf 'point\ttwo\twep\t-\tIt has no setting.\n'
} >"$work/limits"

cat >"$work/expected" <<'END'
## Clients on our access point, in ms

| our network | the first | the second |
| --- | --- | --- |
| open, 2.4 GHz | 1569 | **failed** (1) |
| open, 2.4 GHz, for guests | 1537 | - |
| WEP, 2.4 GHz | refused (2) | 12 |
| WEP, 5 GHz | refused (2) | - |

## Access points for our client, in ms

| its network | the second |
| --- | --- |
| WEP, 2.4 GHz | none (3) |

1. the second, client: The attempt failed: of traffic, address and ping it came to: authorized.
2. the first, client: There is no such thing. It says: `not supported`
3. the second, access point: It has no setting.
END

awk -v titles="$(printf 'one\tthe first\ntwo\tthe second')" -v limits="$work/limits" -f "$joins/table.awk" "$work/cells" \
	>"$work/seen"
diff -u "$work/expected" "$work/seen"

# The page of it.
"$joins/../lab" joins -t "$joins/seen.tsv" >"$work/expected"
sed -n '/^## Clients on our access point/,$p' "$joins/../../../docs/who-joins.md" >"$work/seen"
diff -u "$work/expected" "$work/seen"
