# Lists the messages in sources: a line for each, of its file, its line, its text, and its text as an extended regular
# expression, between tabs. A value is the byte \001, or \002 where it stands between two literals that are put together.
#
# A message is the text that a reporter is given: a word of a command in shell, an argument of a call in C++. A text
# that has no letters of its own, beside the program's name, passes another's message on, and is not listed, except in
# the libraries: nothing there passes one on.

BEGIN {
	kValue = "\001"
	kExpression = "\002"

	# Which word or argument the text is.
	if (shell) {
		split("fail 1 warn 1 tell 1 attempt 1 give_up 2", names, " ")
		kCall = "(^|[ \t;&|{('])(fail|warn|tell|attempt|give_up) "
	} else {
		split("LOG( 1 LOG_LINE( 2 LOG_AS( 3 FAIL( 2 syslog( 2 std::runtime_error( 1 std::system_error( 3 " \
			"std::perror( 1 std::fprintf(stderr, 1 Unreadable( 1 WrongUsage( 1 Failure( 2 Failed( 1 Wrong( 1 " \
			"Unusable( 1 Remark( 1 {Exit:: 2", names, " ")
		kCall = "(^|[^A-Za-z_:])(LOG|LOG_LINE|LOG_AS|FAIL|syslog|std::runtime_error|std::system_error|std::perror" \
			"|Unreadable|WrongUsage|Failure|Failed|Wrong|Unusable|Remark)\\(|std::fprintf\\(stderr,|[{]Exit::"
	}
	for (i = 1; i in names; i += 2) place[names[i]] = names[i + 1]
}

FNR == 1 { finish() }
{
	if (FNR == 1) {
		file = FILENAME
		text = ""
	}
	if ($0 ~ /^[ \t]*(#|\/\/)/) $0 = ""
	else if (!shell && match($0, /[;{},)] +\/\/ /)) $0 = substr($0, 1, RSTART)
	text = text $0 "\n"
}
END { finish() }

function finish(   rest, at) {
	at = 1
	while (match(rest = substr(text, at), kCall)) {
		call = substr(rest, RSTART, RLENGTH)
		gsub(/^[^A-Za-z_{]| $/, "", call)
		at += RSTART + RLENGTH - 1
		begins = at
		if (shell) word(at, place[call])
		else argument(at, place[call])
	}
}

function tell(message,   own, before) {
	own = message
	gsub(/\\([nr]|x1b\[K)|^[a-z-]+: /, "", own)
	if (own !~ /[A-Za-z]/ && !(call ~ /^(LOG|FAIL|syslog)/ && file ~ /^(lib|platform)\//)) return
	own = message
	gsub(/[][\\.^$*+?(){}|]/, "\\\\&", own)
	before = substr(text, 1, begins)
	print file "\t" gsub(/\n/, "", before) + 1 "\t" message "\t" own
}

# ---- Shell -----------------------------------------------------------------------------------------------------------

# The nth word from a place on, in which nothing is quoted before the text.
function word(at, n,   rest, quote, c, message) {
	rest = substr(text, at)
	while (sub(/^\\\n[ \t]*/, "", rest)) continue # the word stands in the next line
	for (; n > 1; --n) sub(/^("[^"]*"|[^ "]+) +/, "", rest)
	quote = substr(rest, 1, 1)
	if (quote != "'" && quote != "\"") return
	for (at = 2; (c = substr(rest, at, 1)) != quote && c != ""; ++at) {
		if (quote == "\"" && c == "$") {
			message = message kValue
			at += length_of_value(substr(rest, at)) - 1
		} else {
			message = message c
		}
	}
	tell(message)
}

# How long the expansion is that a text begins with.
function length_of_value(rest,   at, depth, c) {
	if (match(rest, /^\$([A-Za-z_]+|[0-9*?#@])/)) return RLENGTH
	for (at = 2; at <= length(rest); ++at) {
		c = substr(rest, at, 1)
		if (c ~ /[({]/) ++depth
		if (c ~ /[)}]/ && --depth == 0) return at
	}
	return 1
}

# ---- C++ -------------------------------------------------------------------------------------------------------------

# The nth argument of the call whose arguments begin at a place. Each branch of a conditional is a message.
function argument(at, n,   c, depth, literal, message, value) {
	for (; at <= length(text); ++at) {
		c = substr(text, at, 1)
		if (c == "\"") {
			literal = literal_at(at)
			at += length(literal) + 1
			if (n != 1) continue
			if (depth == 0) {
				message = message (value ? kExpression : "") values_of(literal)
				value = 0
			}
			continue
		}
		# A literal that is made a string is a literal; nothing else in brackets is.
		if (depth == 0 && match(substr(text, at), /^std::string\("([^"\\]|\\.)*"\)/)) {
			literal = literal_at(at + 12)
			at += RLENGTH - 1
			if (n == 1) {
				message = message (value ? kExpression : "") values_of(literal)
				value = 0
			}
			continue
		}
		if (c ~ /[]})]/ && --depth < 0) break
		if (c ~ /[[{(]/) ++depth
		if (c == "," && depth == 0) {
			if (--n == 0) break
			continue
		}
		if (n != 1) continue
		if (c == "?" && depth == 0) {
			value = 0
		} else if (c == ":" && depth == 0 && substr(text, at - 1, 3) == " : ") {
			tell(message (value ? kExpression : ""))
			message = ""
			value = 0
		} else if (c !~ /[ \n+]/) {
			value = 1
		}
	}
	tell(message (value ? kExpression : ""))
}

# What stands between the quotes of the literal that begins at a place.
function literal_at(at,   end) {
	for (end = at + 1; substr(text, end, 1) != "\""; ++end) {
		if (substr(text, end, 1) == "\\") ++end
	}
	return substr(text, at + 1, end - at - 1)
}

function values_of(literal) {
	gsub(/%[-#0-9.*]*[a-zA-Z]/, kValue, literal)
	return literal
}
