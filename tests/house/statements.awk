# The statements of a document: each sentence on a line of its own. Cells of tables are paragraphs, whose sentences begin
# with what their row is about; headings, lines that a table is drawn with, and code that stands by itself are none.
function tell() {
	gsub(/[ \t]+/, " ", paragraph)
	gsub(/^ | $/, "", paragraph)
	while (match(paragraph, /[.!?] ("|`|\(|[A-Z0-9])/)) {
		print about substr(paragraph, 1, RSTART)
		paragraph = substr(paragraph, RSTART + 2)
	}
	if (paragraph != "") print about paragraph
	paragraph = ""
}
/^```/ { tell(); code = !code; next }
code || /^    / { next }
/^#/ || /^$/ || /^\|[ |-]*$/ { tell(); next }
/^\|/ {
	tell()
	for (cells = split($0, cell, "|"); cells > 0; cells--) row[cells] = cell[cells]
	gsub(/^ +| +$/, "", row[2])
	if (row[2] != "") about = row[2] ": "
	for (c = 3; c in row; c++) {
		paragraph = row[c]
		tell()
	}
	about = ""
	delete row
	next
}
/^- / { tell(); sub(/^- /, "") }
{ paragraph = paragraph " " $0 }
END { tell() }
