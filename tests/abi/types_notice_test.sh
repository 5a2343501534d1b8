#!/bin/sh
# types_notice_test.sh CXX ABIDW ABIDIFF
#
# Writes down the interface of a small library, and changes it in each of the ways that programs would suffer from: all of
# them are noticed.
set -eu
cxx=$1 abidw=$2 abidiff=$3
abi=$(dirname "$(realpath "$0")")
work=$(mktemp -d)
trap 'rm -r "$work"' EXIT
mkdir "$work/include"

# Its header and its functions, changed by sed.
library() { # SED-SCRIPT
	sed -e "$1" >"$work/include/small.h" <<-'END'
		enum KIND : int { KIND_NONE = 0, KIND_SMALL = 1, KIND_LARGE = 2 };
		typedef struct SMALL {
		  KIND kind;
		  int first;
		  int second;
		  char szName[16];
		} SMALL;
		typedef struct HIDDEN HIDDEN;
		extern "C" int SmallGet(const SMALL* pSmall, HIDDEN* pHidden, int number);
		extern "C" void SmallSet(SMALL* pSmall, KIND kind);
	END
	sed -e "$1" >"$work/small.cpp" <<-'END'
		#include "small.h"
		struct HIDDEN { int inside; };
		int SmallGet(const SMALL* pSmall, HIDDEN* pHidden, int number) { return pSmall != nullptr && pHidden != nullptr && number; }
		void SmallSet(SMALL* pSmall, KIND kind) { pSmall->kind = kind; }
	END
	"$cxx" -std=c++20 -g -O2 -shared -fPIC -I "$work/include" -o "$work/small.so" "$work/small.cpp"
}

compare() {
	"$abi/types_test.sh" "$abidw" "$abidiff" "$work/small.so" "$work/small.abi" "$work/include"
}

library ''
"$abi/write-types" "$work/include" "$abidw" "$work/small.so" "$work/small.abi"
compare

# What a caller cannot see, and what an argument is called, is the library's own business.
for change in 's/int inside/long elsewhere/' 's/\<number\>/count/g'; do
	library "$change"
	compare || { echo "it is no change of the interface: $change" && exit 1; }
done

while read -r change; do
	library "$change"
	! compare >"$work/said" || { echo "this went unnoticed: $change" && exit 1; }
	grep -q 'has another interface' "$work/said" || { echo "this came to something else: $change" && cat "$work/said" && exit 1; }
done <<'END'
s/\<second\>/other/
s/int second/unsigned second/
s/int second/short second/
/int first/d
s/int second;/&int third;/
s/int first/int swap/; s/int second/int first/; s/int swap/int second/
s/szName.16/szName[20/
s/, KIND_LARGE = 2/&, KIND_HUGE = 3/
s/, KIND_LARGE = 2//
s/KIND_LARGE = 2/KIND_LARGE = 4/
s/KIND_SMALL = 1, KIND_LARGE = 2/KIND_LARGE = 1, KIND_SMALL = 2/
s/KIND_LARGE/KIND_BIG/
s/KIND : int/KIND : short/
s/int number/long number/
s/int number/unsigned number/
s/, int number/, int number, int more/
s/const SMALL/SMALL/
s/int SmallGet/long SmallGet/
s/SmallSet/SmallPut/
/SmallSet/d
s/^void SmallSet.*/&\nextern "C" int SmallMore() { return 1; }/
END
