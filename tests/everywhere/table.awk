# What was seen of the rows, as a table in Markdown: of the rows, as `rows` has them, and of lines with tabs between
#
#   row  suite  processor  compilers  options  level  passed  failed  skipped  seconds  notes  day  sources
#
# in any order, with the words that the row had when it was run. Notes are what failed and what was skipped, with a bar
# between two; under the table, each stands once.

BEGIN { FS = "\t" }

function told_of(suite, processor, compilers, options) {
	return (suite == "bookworm" ? "Debian 12" : suite == "trixie" ? "Debian 13" : suite) " | " processor " | " \
		(compilers ~ /clang/ ? "clang" : "gcc") (options == "-" ? "" : " " options)
}

FNR == NR {
	split($0, word, " ")
	names[++count] = word[1]
	where[word[1]] = told_of(word[2], word[3], word[4], word[5])
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
	print "| row | system | processor | compiler | level | passed | failed | skipped | s | day | commit |"
	print "| --- | --- | --- | --- | --- | --- | --- | --- | --- | --- | --- |"
	for (r = 1; r <= count; r++) {
		name = names[r]
		if (!lines[name]) printf "| %s | %s | not run yet | - | - | - | - | - | - |\n", name, where[name]
		for (l = 1; l <= lines[name]; l++) {
			split(line[name, l], f, "\t")
			printf "| %s | %s | %s | %d | %s | %s | %d | %s | %s |\n", name, told_of(f[2], f[3], f[4], f[5]), f[6], f[7],
				told(f[8], f[11], "failed"), told(f[9], f[11], "skipped"), f[10], f[12], f[13]
		}
	}
	if (note_count) printf "\n"
	for (i = 1; i <= note_count; i++) printf "%d. %s\n", i, notes[i]
}
