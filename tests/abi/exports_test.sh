#!/bin/sh
# exports_test.sh NM CC LIBRARY VERSION_SCRIPT HEADER SYMBOLS SONAME
#
# The library exports the functions of its version script and nothing else, all of them are declared in the header, and
# they are those that its package promises.
set -eu
nm=$1 cc=$2 library=$3 script=$4 header=$5 symbols=$6 soname=$7

work=$(mktemp -d)
trap 'rm -r "$work"' EXIT

"$nm" --dynamic --defined-only "$library" | awk '{ print $2, $3 }' | sort > "$work/exported"
sed -n 's/^ *\([A-Za-z0-9_]*\);$/T \1/p' "$script" | sort > "$work/listed"
diff "$work/listed" "$work/exported"

sed -n "/^$soname /,/^lib/s/^ \([A-Za-z0-9_]*\)@Base .*/T \1/p" "$symbols" | sort > "$work/promised"
diff "$work/promised" "$work/exported"

"$cc" -E -P "$header" | grep -oE '\b(MERO|PLIB)[A-Za-z0-9]+ *\(' | sed 's/^\(.*[A-Za-z0-9]\) *($/T \1/' | sort -u \
  > "$work/declared"
undeclared=$(comm -23 "$work/exported" "$work/declared")
if [ -n "$undeclared" ]; then
  echo "exported but not declared in $header:" "$undeclared"
  exit 1
fi
