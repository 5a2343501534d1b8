#!/bin/bash
# fuzz_test.sh
#
# The table of the fuzz targets tells what each run came to of the code that it is about, and a finding is a failure. In
# the targets' place stands one that says what theirs say.
set -euo pipefail
source=$(dirname "$(realpath "$0")")
house=$(mktemp -d)
trap 'rm -r "$house"' EXIT
cd "$house"

head_of() { printf '// %s\n' "$@" | sed 's/ $//'; } # LINE...

mkdir -p tests/fuzz/seeds/{rows,words} build/tests/fuzz
cp "$source/fuzz" tests/fuzz
touch tests/fuzz/{support.cpp,rows.dict,words.dict} tests/fuzz/seeds/rows/{a,b} tests/fuzz/seeds/words/a
head_of 'Rows of a list: each is read, or' 'none is.' '' 'Runs: 700' 'Covers: lib/rows.cpp lib/text.h' >tests/fuzz/rows.cpp
head_of 'Words: each is one.' '' 'Runs: 20' 'Covers: lib/words.cpp' >tests/fuzz/words.cpp
cat >build/tests/fuzz/fuzz-rows <<'END'
#!/bin/bash
echo "$*" >>calls
cat <<'LOG'
COVERED_FUNC: hits: 9 edges: 4/9 Read(char const*) /src/build/../../lib/rows.cpp:7
  UNCOVERED_PC: /src/build/../../lib/rows.cpp:0
  UNCOVERED_PC: /src/build/../../lib/rows.cpp:0
  UNCOVERED_PC: /src/build/../../lib/rows.cpp:11:3
UNCOVERED_FUNC: hits: 0 edges: 0/3 Write(int, char const*) /src/build/../../lib/rows.cpp:20
COVERED_FUNC: hits: 2 edges: 2/2 Trim() /src/build/../../lib/text.h:3:1
COVERED_FUNC: hits: 2 edges: 7/8 std::sort() /usr/include/other_rows.cpp:3
  UNCOVERED_PC: /usr/include/other_rows.cpp:4
stat::number_of_executed_units: 700
LOG
END
cp build/tests/fuzz/fuzz-{rows,words}
echo '[[ ! -e broken ]] || { echo "broken promise: a word is one" && exit 77; }' >>build/tests/fuzz/fuzz-words
chmod +x build/tests/fuzz/*

fuzz() { tests/fuzz/fuzz build work "$@" >said 2>&1; }

refused() { # ARGUMENT...
  if fuzz "$@"; then
    echo "fuzz takes $*"
    exit 1
  fi
  [[ ! -s calls ]]
}

fuzz
printf '%s\n' 'target runs functions branches findings' 'rows 700 2 of 3 6 of 7 0' 'words 700 0 of 0 0 of 0 0' |
  diff - <(tr -s ' ' <said)
printf '%s\n' lib/rows.cpp:11:3 lib/rows.cpp:20 | diff - work/rows/uncovered
grep -q -- ' -runs=700 -seed_inputs=tests/fuzz/seeds/rows/a,tests/fuzz/seeds/rows/b$' calls

: >calls
fuzz words 2
[[ $(cut -f 1 work/table) == words ]]
grep -q -- '-max_total_time=120 work/words/corpus work/words/findings tests/fuzz/seeds/words$' calls

touch broken
if fuzz; then
  echo "a finding is no failure"
  exit 1
fi
grep -qx 'broken promise: a word is one' said
tr -s ' ' <said | grep -qx 'words 700 0 of 0 0 of 0 1'
cut -f 1,5 work/table | diff - <(printf 'rows\t0\nwords\t1\n')

# Of a target that does not run, or comes to no end, nothing was told.
for said_by_words in '' 'exit 0' 'Runs are unknown'; do
  rm -f broken
  printf '#!/bin/bash\n%s\n' "${said_by_words%Runs*}" >build/tests/fuzz/fuzz-words
  [[ $said_by_words != Runs* ]] || sed -i '/Runs:/d' tests/fuzz/words.cpp
  if fuzz; then
    echo "a target that does not run is no failure ($said_by_words)"
    exit 1
  fi
  cut -f 1,5 work/table | diff - <(printf 'rows\t0\nwords\t1\n')
done

: >calls
refused sentences
refused support
refused words 0
refused words many
refused words 1 2
fuzz --help
grep -qx '  rows  *Rows of a list' said
[[ ! -s calls ]]
