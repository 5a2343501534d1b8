# The table of who joins whom, in Markdown, from what was seen: a line for each attempt, with tabs between
#
#   role  peer  protection  band  network  outcome  milliseconds  words
#
# The role is what the peer is: a client on our access point, or an access point (point) for our client. The network is one
# of our access point's, main or guests. The outcome is joined, with the time from the client's start to the first answered
# ping; refused, with the words of the peer by which it is known that it does not do this; none, when the peer has no
# setting for it; or failed, with what was seen of it. `limits` is the file that knows what peers do not do; `titles` has a
# line for each peer: its name, a tab, its title.

BEGIN {
	FS = "\t"
	n = split(titles, lines, "\n")
	for (i = 1; i <= n; i++) {
		split(lines[i], pair, FS)
		title[pair[1]] = pair[2]
	}
	protection["open"] = "open"
	protection["wep"] = "WEP"
	protection["wpa"] = "WPA"
	protection["wpa2"] = "WPA2"
	protection["mixed"] = "WPA and WPA2"
	protection["peap"] = "WPA2 with PEAP"
	protection["ttls"] = "WPA2 with TTLS"
	heading["client"] = "Clients on our access point"
	heading["point"] = "Access points for our client"
	while ((getline line <limits) > 0) {
		if (line ~ /^(#|$)/) continue
		n = split(line, part, FS)
		n = split(part[3], names, " ")
		for (i = 1; i <= n; i++) reason[part[1], part[2], names[i]] = part[5]
	}
}

{
	role = $1
	row = protection[$3] ", " $4 " GHz" ($5 == "guests" ? ", for guests" : "")
	if (!(role in row_count)) roles[++role_count] = role
	if (!((role, row) in known_row)) rows[role, ++row_count[role]] = row
	if (!((role, $2) in known_peer)) peers[role, ++peer_count[role]] = $2
	known_row[role, row]
	known_peer[role, $2]
	cell[role, row, $2] = shown()
}

function shown() {
	if ($6 == "joined") return $7
	if ($6 == "failed") return "**failed** (" note("The attempt failed: " $8 ".") ")"
	return $6 " (" note(reason[$1, $2, $3] ($8 == "" ? "" : " It says: `" $8 "`")) ")"
}

# The number of a note; one that has stood before keeps its own.
function note(text) {
	text = title[$2] ", " ($1 == "client" ? "client" : "access point") ": " text
	if (!(text in number)) {
		notes[++note_count] = text
		number[text] = note_count
	}
	return number[text]
}

function print_table(role,    line, rule, r, p) {
	line = "| " (role == "client" ? "our network" : "its network") " |"
	rule = "| --- |"
	for (p = 1; p <= peer_count[role]; p++) {
		line = line " " title[peers[role, p]] " |"
		rule = rule " --- |"
	}
	print line
	print rule
	for (r = 1; r <= row_count[role]; r++) {
		line = "| " rows[role, r] " |"
		for (p = 1; p <= peer_count[role]; p++) line = line " " value(role, rows[role, r], peers[role, p]) " |"
		print line
	}
}

function value(role, row, peer) {
	return ((role, row, peer) in cell) ? cell[role, row, peer] : "-"
}

END {
	for (i = 1; i <= role_count; i++) {
		printf "%s## %s, in ms\n\n", (i > 1 ? "\n" : ""), heading[roles[i]]
		print_table(roles[i])
	}
	if (note_count) printf "\n"
	for (i = 1; i <= note_count; i++) printf "%d. %s\n", i, notes[i]
}
