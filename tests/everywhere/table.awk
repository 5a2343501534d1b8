# What was seen of the rows, as a table in Markdown: of the rows, as `rows` has them, and of lines with tabs between
#
#   row  level  passed  failed  skipped  seconds  notes  day
#
# in any order. Notes are what failed and what was skipped, with a bar between two; under the table, each stands once.

BEGIN { FS = "\t" }

FNR == NR {
	split($0, word, " ")
	names[++count] = word[1]
	system_of[word[1]] = (word[2] == "bookworm" ? "Debian 12" : word[2] == "trixie" ? "Debian 13" : word[2])
	processor[word[1]] = word[3]
	compiler[word[1]] = word[4] ~ /clang/ ? "clang" : "gcc"
	if (word[5] != "-") compiler[word[1]] = compiler[word[1]] " " word[5]
	next
}

{ line[$1, ++lines[$1]] = $0 }

function note(text) {
	if (!(text in number)) {
		notes[++note_count] = text
		number[text] = note_count
	}
	return number[text]
}

# The figures of what is told of, such as "2 (1, 4)".
function told(figure, texts, kind,    n, i, text, numbers) {
	n = split(texts, text, "|")
	for (i = 1; i <= n; i++)
		if (text[i] ~ "^" kind ": ") numbers = numbers (numbers == "" ? "" : ", ") note(substr(text[i], length(kind) + 3))
	return (figure && kind == "failed" ? "**" figure "**" : figure) (numbers == "" ? "" : " (" numbers ")")
}

END {
	print "| row | system | processor | compiler | level | passed | failed | skipped | s | day |"
	print "| --- | --- | --- | --- | --- | --- | --- | --- | --- | --- |"
	for (r = 1; r <= count; r++) {
		name = names[r]
		if (!lines[name]) {
			printf "| %s | %s | %s | %s | not run yet | - | - | - | - | - |\n", name, system_of[name], processor[name],
				compiler[name]
		}
		for (l = 1; l <= lines[name]; l++) {
			split(line[name, l], f, "\t")
			printf "| %s | %s | %s | %s | %s | %d | %s | %s | %d | %s |\n", name, system_of[name], processor[name],
				compiler[name], f[2], f[3], told(f[4], f[7], "failed"), told(f[5], f[7], "skipped"), f[6], f[8]
		}
	}
	if (note_count) printf "\n"
	for (i = 1; i <= note_count; i++) printf "%d. %s\n", i, notes[i]
}
