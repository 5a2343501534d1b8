# The tables of a race, from its figures: a line for each start, with tabs between
#
#   event  air  band  state  contender  round  beacon  authorized  address  ping  processes  started
#   memory  memory of the bus  processor  processor of the bus  scan
#
# and one for each contender and event with the KiB that are installed of the contender, and with it,
#
#   size  contender  event  own  all
#
# where times are in microseconds, memory is in KiB, and "-" stands for what was not seen. `titles` has a line for each
# contender: its name, a tab, its title.

BEGIN {
	FS = "\t"
	n = split(titles, lines, "\n")
	for (i = 1; i <= n; i++) {
		split(lines[i], pair, "\t")
		title[pair[1]] = pair[2]
	}
}

$1 == "size" {
	if (!($2 in own)) sized[++sized_count] = $2
	own[$2, $3] = $4
	all[$2, $3] = $5
	own[$2]
	next
}

# What was seen of a figure in a table's row, and in which order rows and tables come.
{
	table = $1 FS $2 FS $3 FS $4
	row = table FS $5
	if (!(table in rows)) tables[++table_count] = table
	if (!(row in rounds)) row_of[table, ++rows[table]] = $5
	rounds[row]++
	if (rounds[row] > most[table]) most[table] = rounds[row]
	for (column = 7; column <= 17; column++) add(row, column, $column)
	add(row, "memory and bus", sum($13, $14))
	add(row, "processor and bus", sum($15, $16))
}

function add(row, column, value) {
	if (value == "-") return
	seen[row, column, ++count[row, column]] = value + 0
}

function sum(a, b) { return a == "-" || b == "-" ? "-" : a + b }

# Sorts what was seen of a figure; the median and the ends stand in middle, least and greatest then.
function order(row, column,    n, i, j, value) {
	n = count[row, column]
	for (i = 2; i <= n; i++) {
		value = seen[row, column, i]
		for (j = i - 1; j > 0 && seen[row, column, j] > value; j--) seen[row, column, j + 1] = seen[row, column, j]
		seen[row, column, j + 1] = value
	}
	least = seen[row, column, 1]
	greatest = seen[row, column, n]
	middle = n % 2 ? seen[row, column, (n + 1) / 2] : (seen[row, column, n / 2] + seen[row, column, n / 2 + 1]) / 2
}

# A figure with its spread, in a unit of so many; those that not every round has come to are told.
function figure(row, column, unit, digits,    text) {
	if (!count[row, column]) return "-"
	order(row, column)
	text = sprintf("%.*f", digits, middle / unit)
	if (greatest > least) text = text sprintf(" (%.*f-%.*f)", digits, least / unit, digits, greatest / unit)
	if (count[row, column] < rounds[row]) text = text sprintf(" %d of %d", count[row, column], rounds[row])
	return text
}

function median(row, column, unit, digits) {
	if (!count[row, column]) return "-"
	order(row, column)
	return sprintf("%.*f", digits, middle / unit)
}

function heading(table,    part) {
	split(table, part, FS)
	return sprintf("%s, %s, %s GHz, %s: medians of %d%s",
		part[1] == "join" ? "Joining" : "Access point",
		part[2] == "alone" ? "alone" : "among eight access points", part[3], part[4], most[table],
		most[table] > 1 ? " (the least and the most)" : "")
}

END {
	for (t = 1; t <= table_count; t++) {
		table = tables[t]
		is_join = table ~ /^join/
		first = is_join ? "authorized ms" : "beacon ms"
		if (t > 1) printf "\n"
		printf "%s\n\n", heading(table)
		printf "%-20s  %-20s", "", first
		if (is_join) printf "  %-20s", "address ms"
		printf "  %-20s  %9s  %7s  %6s  %8s  %12s  %8s", "ping ms", "processes", "started", "MB", "with bus", "processor ms",
			"with bus"
		if (is_join) printf "  %-20s", "scan ms"
		printf "\n"
		for (r = 1; r <= rows[table]; r++) {
			name = row_of[table, r]
			row = table FS name
			printf "%-20s  %-20s", name in title ? title[name] : name, figure(row, is_join ? 8 : 7, 1000, 0)
			if (is_join) printf "  %-20s", figure(row, 9, 1000, 0)
			printf "  %-20s  %9s  %7s  %6s  %8s  %12s  %8s", figure(row, 10, 1000, 0), median(row, 11, 1, 0),
				median(row, 12, 1, 0), median(row, 13, 1024, 1), median(row, "memory and bus", 1024, 1),
				median(row, 15, 1000, 0), median(row, "processor and bus", 1000, 0)
			if (is_join) printf "  %-20s", figure(row, 17, 1000, 0)
			printf "\n"
		}
	}
	if (sized_count == 0) exit
	printf "\nInstalled, MB: the packages of the contender itself; all that they bring to Debian's usual packages\n\n"
	printf "%-20s  %-16s  %-16s\n", "", "joining", "access point"
	for (i = 1; i <= sized_count; i++) {
		name = sized[i]
		printf "%-20s  %-16s  %-16s\n", name in title ? title[name] : name, installed(name, "join"), installed(name, "ap")
	}
}

function installed(name, event) {
	if (!((name, event) in own)) return "-"
	return sprintf("%.1f; %.1f", own[name, event] / 1024, all[name, event] / 1024)
}
