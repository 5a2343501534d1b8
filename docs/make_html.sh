#!/bin/sh
# make_html.sh SOURCE_DIRECTORY DIRECTORY
#
# Makes pages for a browser, anew in a directory of its own: of the manual, of all documents in Markdown and of the two
# headers, each where it is in the source tree, and one that leads to them all. Fails when a link leads nowhere.
set -eu
export LC_ALL=C.UTF-8

rm -rf "$2"
mkdir -p "$2/docs"
source=$(realpath "$1") directory=$(realpath "$2")
cd "$source"

work=$(mktemp -d)
trap 'rm -r "$work"' EXIT
docs/man/make_pages.sh . "$work/manual"
cp docs/man/*.[158] "$work/manual"
documents=$(echo README.md SECURITY.md CONTRIBUTING.md CHANGELOG.md docs/*.md tests/*/README.md examples/*/README.md)
# Without pages that only lead to another one.
manual=$(cd "$work/manual" && grep -L '^\.so ' ./*.1 ./*.3 ./*.5 ./*.8 | sed 's,^\./,,')

title_of() { sed -n '/^# /{s///p;q}' "$1"; } # DOCUMENT

# The way from a page to the directory, such as "../../".
way_up() { echo "$1" | sed 's,[^/]*$,,; s,[^/]*/,../,g'; } # PAGE

# write_page PAGE TITLE: what is on standard input, with a head and a foot.
write_page() {
  mkdir -p "$(dirname "$directory/$1")"
  {
    echo '<!DOCTYPE html><html lang="en"><head><meta charset="utf-8"/>'
    echo '<meta name="viewport" content="width=device-width"/>'
    echo "<title>$2</title><link rel=\"stylesheet\" href=\"$(way_up "$1")docs/style.css\"/></head>"
    echo "<body><nav><a href=\"$(way_up "$1")index.html\">libmerowireless-core</a></nav>"
    cat
    echo '</body></html>'
  } >"$directory/$1"
}

# link_pages PAGE: links what is on standard input to the pages that it names, for a page at that place.
link_pages() { sed -E "$(sed "s,@UP@,$(way_up "$1"),g" "$work/links")"; }

# Links that lead to sources lead to the pages that are made of them. Pages of the manual that are named, such as
# "mero-wireless.conf(5)", and documents that the manual names become links, and what a page in section 3 describes is
# found there.
write_links() {
  printf '%s\n' 's,href="([^":]*)\.md",href="\1.html",g' 's,href="([^":]*\.[1358h])",href="\1.html",g' \
    's,href="docs/man",href="index.html",' 's,(<dd[^>]*>)&#x00A0;</dd>,\1</dd>,'
  for page in $manual; do
    printf 's,(^|[ (]|<td>)(%s\\(%s\\)),\\1<a href="@UP@docs/man/%s.html">\\2</a>,g\n' \
      "${page%.*}" "${page##*.}" "$page"
  done
  for document in $documents; do
    echo "s,<span class=\"Pa\">${document##*/}</span>,<a href=\"@UP@${document%.md}.html\">&</a>,g"
  done
  (cd "$work/manual" && grep '^\.so ' ./*) |
    sed -E 's,^\./(.*)\.3:\.so man3/(.*)$,s\,"\1.3.html"\,"\2.html#\1"\,,'
}

contents() {
  echo '<h1>libmerowireless-core</h1><h2>Documents</h2><dl class="contents">'
  for document in $documents; do
    echo "<dt><a href=\"${document%.md}.html\">$document</a></dt><dd>$(title_of "$document")</dd>"
  done
  echo '</dl><h2>Manual</h2><dl class="contents">'
  for page in $manual; do
    echo "<dt><a href=\"docs/man/$page.html\">${page%.*}(${page##*.})</a></dt>"
    sed -n 's,^\.Nd \(.*\),<dd>\1</dd>,p' "$work/manual/$page"
  done
  echo '</dl><h2>Headers</h2><dl class="contents">'
  for header in include/*.h; do
    echo "<dt><a href=\"$header.html\">$header</a></dt>"
    sed -n '3s,^ \* \([^:]*\).*,<dd>\1</dd>,p' "$header"
  done
  echo '</dl>'
}

# Each link, or source of a picture, that leads to no file, or to no place in it.
dead_links() {
  cd "$directory"
  find . -name '*.html' | while read -r page; do
    grep -oE '(href|src)="[^"]*"' "$page" | cut -d '"' -f 2 | sort -u | grep -vE '^(https|mailto):' | while read -r link; do
      case $link in
        '#'*) to=$page ;;
        *) to=$(dirname "$page")/${link%#*} ;;
      esac
      case $link in
        *'#'*) grep -qsF "id=\"${link##*#}\"" "$to" ;;
        *) [ -f "$to" ] ;;
      esac || echo "$page: nothing is at $link"
    done
  done
}

write_links >"$work/links"
for document in $documents; do
  page=${document%.md}.html
  cmark-gfm -e table "$document" | link_pages "$page" | write_page "$page" "$(title_of "$document")"
done
for page in $manual; do
  (cd "$work/manual" && mandoc -Thtml -O 'fragment,includes=../../include/%I.html' \
    -O 'man=%N.%S.html;https://manpages.debian.org/%N.%S' "$page") |
    link_pages "docs/man/$page.html" | write_page "docs/man/$page.html" "${page%.*}(${page##*.})"
done
for header in include/*.h; do
  { echo '<pre>' && sed 's/&/\&amp;/g; s/</\&lt;/g' "$header" && echo '</pre>'; } |
    write_page "$header.html" "${header##*/}"
done
contents | write_page index.html libmerowireless-core
cp docs/style.css "$directory/docs"
mkdir "$directory/docs/pictures"
cp docs/pictures/*.svg "$directory/docs/pictures"

dead=$(dead_links)
[ -z "$dead" ] || { echo "$dead" >&2 && exit 1; }
