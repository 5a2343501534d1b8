#!/bin/sh
# manual_test.sh CHECK SOURCE_DIRECTORY BUILD_DIRECTORY [ARGUMENT]
#
# One of the checks below: the manual agrees with the headers, the sources or the program. What differs is named, with
# "<" before what the manual lacks and ">" before what only the manual has.
set -eu
export LC_ALL=C
check=$1 source=$2 build=$3 argument=${4-}

# The pages, but for those that only lead to another one: of section 3 as they were made, of the others as written.
work=$(mktemp -d)
trap 'rm -r "$work"' EXIT
manual=$work/described
mkdir "$manual"
cp "$source"/docs/man/*.[158] "$manual"
for page in "$source"/docs/man/*.3.in; do cp "$build/manual/man3/$(basename "$page" .in)" "$manual"; done

# ---- What there is -------------------------------------------------------------------------------------------------

exported() {
  sed -n 's/^ *\([A-Za-z0-9_]*\);$/\1/p' "$source/platform/core/merocore.map" "$source/platform/sdk/merosdk.map" \
    "$source/lib/merowireless-core.map"
}

# Both headers, without comments and directives.
headers() {
  cat "$source/include/wireless.h" "$source/include/platform.h" | awk '
    { text = text $0 "\n" }
    END {
      while ((start = index(text, "/*")) > 0) {
        rest = substr(text, start)
        text = substr(text, 1, start - 1) substr(rest, index(rest, "*/") + 2)
      }
      printf "%s", text
    }' | grep -v '^#'
}

headers_in_one_line() { headers | tr -s ' \n' ' '; }

declared() {
  headers_in_one_line | grep -oE '[^{};]*\b(MERO|PLIB)[A-Za-z0-9]+\([^)]*\);' | sed 's/^ *//; s/);$/)/'
}

types() {
  headers_in_one_line | grep -oE '(enum [A-Z_]+ MERO_INT32|(\}|struct [A-Z_]+) [A-Z_]+(, \*[A-Z_]+)*;)' |
    sed 's/^enum \([A-Z_]*\) .*/\1/; s/^struct [A-Z_]* //' | tr -c 'A-Z_\n' '\n' | sed '/^$/d'
}

constants() { headers_in_one_line | grep -oE '\b[A-Z][A-Z0-9_]+ = [0-9][0-9A-Fx]*'; }

# Each as "RECORD: TYPE MEMBER"; those of a union within a record have its name before theirs.
members() {
  headers | awk '
    /^typedef (struct|union) .*\{$/ { record = $3; next }
    /^\}/ { record = "" }
    record == "" { next }
    / union \{$/ { inner = 1; count = 0; next }
    inner && / \} / {
      sub(/;/, "", $2)
      for (i = 1; i <= count; ++i) { sub(/[^ ]+$/, $2 ".&", held[i]); print record ": " held[i] }
      inner = 0
      next
    }
    /;/ {
      sub(/^ +/, "")
      sub(/;.*/, "")
      if (inner) held[++count] = $0; else print record ": " $0
    }'
}

# As patterns, in which any word in capitals stands for what a program fills in.
files() {
  (cd "$source" && find lib common platform tools -name '*.[ch]*' -exec grep -hoE '"[^"]*"' {} +) |
    grep -oP '(?<!\w)/(etc|etc\.defaults|usr/mero|var|run|tmp|sbin)/[^" \\]+'
  grep -rhoE '^[a-z_]+=/(etc|usr/mero|var|run|tmp|sbin)/[^ ]+' "$source/appliance" | sed 's/.*=//'
  cat "$source/README.md" "$source"/docs/*.md | sed -n 's/^|\([^|]*\)|.*/\1/p' | tr '`' ' ' | grep -oE ' /[^ ,*]+' |
    tr -d ' '
}

# The files that a component installs, from the build directory.
installed() { # COMPONENT
  DESTDIR=$work/$1 cmake --install "$build" --component "$1" >"$work/log" || fail "$(cat "$work/log")"
  (cd "$work/$1" && find . -not -type d | sed 's/^\.//')
}

# Besides the manual and other documents.
installed_kit() { installed appliance | grep -v /share/; }

as_pattern() { sed 's/[.*]/\\&/g; s/%\([0-9]*\$\)\{0,1\}s/[A-Z]+/g'; }

# program_options COMMAND...: each as "COMMAND: OPTION". Every command has --help.
program_options() {
  help=$("$argument" "$@" --help)
  printf '%s\n' "$help" | sed -n '/^Options:/,/^$/s/^  \(-[^ {]*\).*/\1/p' | tr ',' '\n' |
    if [ $# -eq 0 ]; then cat; else grep -vxE -e '-h|--help' || [ $? -eq 1 ]; fi | sed "s/^/$*: /"
  subcommands=$(printf '%s\n' "$help" | sed -n '/^Subcommands:/,/^$/s/^  \([a-z]\{1,\}\) .*/\1/p')
  if [ -z "$subcommands" ]; then echo "$*"; fi
  for subcommand in $subcommands; do (program_options "$@" "$subcommand"); done
}

program_statuses() { "$argument" --help | sed -n '/^Exit status:/,/^Usage:/p' | grep -oE '\<[0-9]+\>'; }

# The commands of a script of the appliance, by its usage.
script_commands() {
  sed -n "s/^\(usage:\| *\) ${argument##*/} //p" "$argument" | sed 's/  .*//; s/ [A-Z[].*//' | split_choices
}

# "change-mode ap|client" is two commands.
split_choices() { sed 's/^\(.*\) \(.*\)|\(.*\)$/\1 \2\n\1 \3/'; }

# ---- What the manual has -------------------------------------------------------------------------------------------

# Each as "NAME PAGE".
names() { # SECTION
  for page in "$manual"/*."$1"; do
    sed -n "/^\.Sh NAME/,/^\.Nd/s/^\.Nm \([^ ]*\).*/\1 $(basename "$page" ".$1")/p" "$page"
  done
}

described_functions() {
  cat "$manual"/*.3 | awk '
    /^\.Sh/ { inside = /SYNOPSIS/ }
    !inside { next }
    /^\.Ft / { gsub(/"/, ""); type = substr($0, 5) }
    /^\.Fn / {
      sub(/^\.Fn /, "")
      sub(/ /, "(")
      gsub(/" "/, ", ")
      gsub(/"/, "")
      print type " " $0 ")"
    }'
}

described_constants() { cat "$manual"/*.3 | sed -n 's/^\.It Dv \(.* = .*\)/\1/p'; }

described_members() {
  cat "$manual"/*.3 | awk '
    /^\.It Vt (struct|union) / { record = $4 }
    /^\.It Li "/ && record != "" { gsub(/"/, ""); print record ": " substr($0, 8) }
    /^\.El/ { record = "" }'
}

described_options() {
  awk '
    /^\.Sh/ { inside = /DESCRIPTION/; command = "" }
    !inside { next }
    /^\.It Cm / {
      command = $3
      for (i = 4; i <= NF && $i ~ /^[a-z]+$/; ++i) command = command " " $i
      print command
    }
    command != "" || /^\.It/ {
      while (match($0, /Fl -?[a-z]([a-z0-9-]*[a-z0-9])?/)) {
        print command ": -" substr($0, RSTART + 3, RLENGTH - 3)
        $0 = substr($0, RSTART + RLENGTH)
        if (command == "") while (match($0, /^ , -?[a-z]+/)) {
          print ": -" substr($0, 4, RLENGTH - 3)
          $0 = substr($0, RLENGTH + 1)
        }
      }
    }' "$manual/merowireless.1"
}

described_statuses() { sed -n '/^\.Sh EXIT STATUS/,/^\.Sh EXAMPLES/s/^\.It \([0-9]*\)$/\1/p' "$manual/merowireless.1"; }

# In the lines that name them.
described_paths() { grep -hE '(^|[. ])Pa ' "$manual"/*.[1358]; }

# The types that a heading is about.
headed_types() { cat "$manual"/*.3 | sed -n 's/^\.It Vt \(enum\|struct\|union\) //p' | tr -s ' ,' '\n'; }

described_script_commands() {
  sed -n 's/^\.It Cm \([a-z -]*[a-z]\).*/\1/p' "$manual/${argument##*/}.8" | grep -vx help
}

# ---- The checks ----------------------------------------------------------------------------------------------------

# expect_same THERE_IS MANUAL_HAS: what two functions tell, of which there is more than nothing.
expect_same() {
  $1 | sort -u >"$work/there"
  $2 | sort -u >"$work/manual"
  [ -s "$work/there" ] || fail "$1 tells nothing"
  diff "$work/there" "$work/manual"
}

fail() {
  echo "$*"
  exit 1
}

expect_all() { # WHAT: each line of the file "lacking" is something that no page has
  [ ! -s "$work/lacking" ] || fail "no page has the $1 $(tr '\n' ' ' <"$work/lacking")"
}

# expect_among THERE_IS PAGES_HAVE: all that one function tells is what the other tells.
expect_among() {
  $1 | sort -u >"$work/there"
  [ -s "$work/there" ] || fail "$1 tells nothing"
  $2 | sort -u | comm -23 "$work/there" - >"$work/lacking"
  expect_all "$1"
}

page_names() { names 3 | cut -d ' ' -f 1; }

# Those with the libraries' prefixes. Others, such as BOOL, are no names to claim in a manual that everybody shares.
own() { grep -E '^(libmero|P?(MERO|PLIB|WIRELESS_))'; }

own_types() { types | own; }

described_types() { page_names && headed_types; }

expect_functions() {
  expect_among exported page_names
  expect_same declared described_functions
}

expect_types() {
  expect_among types described_types
  expect_among own_types page_names
}

expect_files() {
  files | as_pattern | sort -u >"$work/files"
  [ -s "$work/files" ] || fail 'there is no file'
  described_paths >"$work/paths"
  while IFS= read -r file; do
    grep -qE -- "$file([^A-Za-z0-9_]|$)" "$work/paths" || echo "$file"
  done <"$work/files" >"$work/lacking"
  expect_all files
}

# Each file that is installed is one of those that the pages name, perhaps along with others: "DIRECTORY/*.sh".
expect_installed() {
  described_paths | grep -oE '/[^ ,]+' | sort -u >"$work/patterns"
  installed_kit >"$work/there"
  [ -s "$work/there" ] || fail 'nothing is installed'
  while IFS= read -r file; do is_like_one_of "$file" "$work/patterns" || echo "$file"; done \
    <"$work/there" >"$work/lacking"
  expect_all 'installed files'
}

is_like_one_of() { # TEXT PATTERNS
  while IFS= read -r pattern; do
    # shellcheck disable=SC2254  # it is a pattern
    case $1 in $pattern) return ;; esac
  done <"$2"
  return 1
}

# Each further name that bears the libraries' prefixes is installed as a page that leads to the one that describes it,
# and no other is; and all are something that there is.
expect_names() {
  installed development | sed -n 's,.*/man3/,,p' | sort >"$work/installed"
  { names 3 | cut -d ' ' -f 2 && page_names | own; } | sed 's/$/.3/' | sort -u | diff - "$work/installed"
  pages=$(dirname "$(find "$work/development" -name libmerowireless-core.3)")
  names 3 | while read -r name page; do
    [ "$name" = "$page" ] || ! [ -e "$pages/$name.3" ] || echo ".so man3/$page.3" | diff - "$pages/$name.3"
  done
  { exported && types && names 3 | cut -d ' ' -f 2 && echo libmerosdk; } | sort -u >"$work/there"
  strange=$(page_names | sort -u | comm -13 "$work/there" -)
  [ -z "$strange" ] || fail "there is no $strange"
}

# Takes the examples out of the pages, each into a file "PAGE.NUMBER.c": what is shown under EXAMPLES.
take_examples() {
  for page in "$manual"/*.3; do
    awk -v to="$work/examples/$(basename "$page" .3)" '
      /^\.Sh/ { inside = /EXAMPLES/ }
      inside && /^\.Bd/ { file = to "." ++count ".c"; next }
      /^\.Ed/ { file = "" }
      file == "" { next }
      { sub(/^\\&/, ""); gsub(/\\-/, "-"); gsub(/\\e/, "\\"); print >file }' "$page"
  done
}

# Strictly as C99, but for insque(3).
expect_examples() {
  mkdir "$work/examples"
  take_examples
  for example in "$work"/examples/*.c; do
    "$argument" -std=c99 -D_XOPEN_SOURCE=700 -pedantic -Wall -Wextra -Werror -I"$source/include" -c "$example" \
      -o "$work/object" || fail "$(basename "$example") is no good"
  done
  for page in "$manual"/*.3; do
    name=$(basename "$page" .3)
    sed -n 's/^\.Fn \([A-Za-z0-9]*\) [^.,].*/\1/p' "$page" | while read -r called; do
      cat "$work/examples/$name".*.c | grep -q "\<$called(" || echo "$called"
    done
  done >"$work/lacking"
  expect_all 'example of'
}

# The program that the README shows is the one that is installed as an example.
# shellcheck disable=SC2016  # the backquotes are Markdown's
expect_readme() { sed -n '/^```c$/,/^```$/{//!p}' "$source/README.md" | diff - "$source/examples/scan-one/scan_one.c"; }

# What a page names as SECURITY.md, say, comes with the program.
expect_documents() {
  installed program | sed -n 's,.*/,,; /\.md$/p' | sort >"$work/there"
  described_paths | grep -oE '[A-Za-z-]+\.md' | sort -u | comm -13 "$work/there" - >"$work/lacking"
  [ ! -s "$work/lacking" ] || fail "there is no $(cat "$work/lacking")"
}

# References to other packages' pages are few, and listed.
expect_references() {
  for section in 1 3 5 8; do names "$section" | sed "s/ .*/ $section/"; done >"$work/pages"
  printf '%s\n' 'flock 2' 'free 3' 'insque 3' 'remque 3' 'syslog 3' 'dnsmasq 8' 'hostapd 8' 'nft 8' >>"$work/pages"
  sort -u -o "$work/pages" "$work/pages"
  cat "$manual"/*.[1358] | sed -n 's/^\.Xr \([^ ]* [0-9]\).*/\1/p' | sort -u | comm -13 "$work/pages" - >"$work/lacking"
  expect_all 'references to'
}

# Of a program, whose usage is not in a script to be read.
expect_program() {
  "$argument" --help >"$work/${argument##*/}"
  argument=$work/${argument##*/}
  expect_same script_commands described_script_commands
}

case $check in
  functions) expect_functions ;;
  types) expect_types ;;
  constants) expect_same constants described_constants ;;
  documents) expect_documents ;;
  examples) expect_examples ;;
  members) expect_same members described_members ;;
  files) expect_files ;;
  installed) expect_installed ;;
  script) expect_same script_commands described_script_commands ;;
  program) expect_program ;;
  commands) expect_same program_options described_options ;;
  statuses) expect_same program_statuses described_statuses ;; # 7 was not in the help
  names) expect_names ;;
  readme) expect_readme ;;
  references) expect_references ;;
  browser) "$source/docs/make_html.sh" "$source" "$work/browser" ;;
  form) "$argument" -Tlint -Wwarning "$manual"/*.[1358] ;;
  *) fail "there is no check '$check'" ;;
esac
