#!/bin/sh
# make_pages.sh SOURCE_DIRECTORY DIRECTORY
#
# Makes the manual's section 3 anew, in a directory of its own. Functions and types that bear the libraries' prefixes
# get a page each that leads to the one that describes them; `man bool` is not for us to answer.
set -eu
export LC_ALL=C
source=$1 directory=$2

rm -rf "$directory"
mkdir -p "$directory"
for template in "$source"/docs/man/*.3.in; do
  page=$(basename "$template" .3.in)
  awk -f "$source/docs/man/page.awk" "$source/include/wireless.h" "$source/include/platform.h" "$template" \
    >"$directory/$page.3"
  sed -nE '/^\.Sh NAME/,/^\.Nd/s/^\.Nm ((libmero|P?(MERO|PLIB|WIRELESS_))[^ ]*).*/\1/p' "$directory/$page.3" |
    while read -r name; do
      [ "$name" = "$page" ] || echo ".so man3/$page.3" >"$directory/$name.3"
    done
done
