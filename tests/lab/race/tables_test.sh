#!/bin/sh
# tables_test.sh
#
# The tables of the race tell the median of the rounds, the least and the most, and what some rounds did not come to.
set -eu
export LC_ALL=C.UTF-8 # as the lab has it
race=$(dirname "$(realpath "$0")")

line() { # EVENT STATE CONTENDER ROUND BEACON AUTHORIZED ADDRESS PING SCAN
	printf '%s\talone\t2.4\t%s\t%s\t%s\t%s\t%s\t%s\t%s\t2\t10\t20480\t10240\t50000\t5000\t%s\n' "$@"
}

seen=$({
	line join cold one 1 - 3000000 3100000 3200000 2000000
	line join cold one 2 - 1000000 1100000 1200000 2000000
	line join cold one 3 - 2000000 2100000 - 2000000
	line join warm one 1 - 9000 10000 11000 12000
	line join cold two 1 - 1000 1000 1000 -
	line join cold two 2 - 2000 2000 2000 -
	line ap cold one 1 100000 - - 200000 -
	printf 'size\tone\tjoin\t5120\t20480\n'
} | awk -v titles="$(printf 'one\tthe first\ntwo\tthe second')" -f "$race/tables.awk" | tr -s ' ' | sed 's/ $//')

expected='Joining, alone, 2.4 GHz, cold: medians of 3 (the least and the most)

 authorized ms address ms ping ms processes started MB with bus processor ms with bus scan ms
the first 2000 (1000-3000) 2100 (1100-3100) 2200 (1200-3200) 2 of 3 2 10 20.0 30.0 50 55 2000
the second 2 (1-2) 2 (1-2) 2 (1-2) 2 10 20.0 30.0 50 55 -

Joining, alone, 2.4 GHz, warm: medians of 1

 authorized ms address ms ping ms processes started MB with bus processor ms with bus scan ms
the first 9 10 11 2 10 20.0 30.0 50 55 12

Access point, alone, 2.4 GHz, cold: medians of 1

 beacon ms ping ms processes started MB with bus processor ms with bus
the first 100 200 2 10 20.0 30.0 50 55

Installed, MB: the packages of the contender itself; all that they bring to Debian'"'"'s usual packages

 joining access point
the first 5.0; 20.0 -'

[ "$seen" = "$expected" ] && exit
printf 'expected\n%s\nseen\n%s\n' "$expected" "$seen"
exit 1
