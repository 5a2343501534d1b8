# awk -f page.awk HEADER... PAGE.3.in: writes a page of section 3 in mdoc. What is told of functions and types is in the
# headers' comments; the page itself has the rest. Its lines are copied, but for these:
#
#   @names OF        what the page is called besides its own name
#   @synopsis OF     the functions' declarations
#   @rules HEADER    what the header says of all its functions
#   @describe OF     functions and types, one after the other
#   @example         all lines up to one with @end are shown as they stand
#
# OF is a group of declarations, which a line such as "/* ---- Scanning ---- */" begins in a header, or a header with
# all its groups.

# ---- The headers ---------------------------------------------------------------------------------------------------

FNR == 1 {
  header = FILENAME
  sub(/.*\//, "", header)
  is_page = header !~ /\.h$/
  group = comment = ""
}

is_page { page[++page_lines] = $0; next }

in_comment { add_comment($0); next }

/^\/\* ---- / {
  group = $0
  gsub(/^\/\* -+ | -+ \*\/$/, "", group)
  header_of[group] = header
  groups[++group_count] = group
  next
}

/^\/\*/ {
  comment = ""
  is_doc = /^\/\*\*/
  in_comment = 1
  add_comment($0)
  next
}

in_declaration { declare($0); next }

comment != "" && NF && !/^#/ { in_declaration = 1; declaration = ""; declare($0) }

function add_comment(line) {
  in_comment = line !~ /\*\/$/
  sub(/^ ?\/?\*+\/? ?/, "", line)
  sub(/ *\*\/$/, "", line)
  if (sub(/^@file.*/, "", line)) is_doc = 2
  gsub(/ @return/, "\n@return", line)
  comment = comment line "\n"
  if (in_comment) return
  if (is_doc == 2) rules[header] = comment
  else if (is_doc) return
  else if (group != "") add_item("prose", "", comment)
  comment = ""
}

function add_item(kind, name, text) {
  item_kind[++items] = kind
  item_group[items] = group
  item_name[items] = name
  item_text[items] = text
}

# Takes lines until the declaration is whole: all braces are closed again.
function declare(line,    text) {
  declaration = declaration line "\n"
  text = declaration
  if (gsub(/[{]/, "", text) > gsub(/[}]/, "", text) || text !~ /;[^;]*$/ || text ~ /\/\*\*<[^\/]*$/) return
  in_declaration = 0
  if (group != "") take_declaration(declaration)
  comment = ""
}

function take_declaration(text,    name, kind) {
  if (text ~ /^enum /) kind = "enum"
  else if (text ~ /^typedef /) kind = "record"
  else kind = "function"
  name = text
  if (kind == "function") {
    gsub(/[ \n]+/, " ", text)
    sub(/\(.*/, "", name)
    sub(/.*[ *]/, "", name)
    function_group[name] = group
  } else {
    sub(/^(typedef )?(enum|struct|union) /, "", name)
    sub(/[^A-Za-z0-9_].*/, "", name)
    is_type[name] = 1
    if (kind == "record") {
      sub(/ \*\/$/, "", text)
      name = name further_names(text)
    }
    remember_members(text)
  }
  add_item(kind, name, comment)
  item_code[items] = text
}

# The names behind a record's closing brace, or in place of one, besides its first.
function further_names(text,    list, count, i, all) {
  sub(/;[^;]*$/, "", text)
  if (!sub(/^.*\n[}] /, "", text)) sub(/^typedef [a-z]+ [A-Z_a-z]+ /, "", text)
  gsub(/[*\n]/, "", text)
  count = split(text, list, ", ")
  for (i = 1; i <= count; ++i) {
    is_type[list[i]] = 1
    all = all " " list[i]
  }
  return all
}

function remember_members(text,    lines, count, i, word) {
  gsub(/\/\*\*<[^*]*\*\//, "", text)
  gsub(/ [{}] /, "\n", text)
  count = split(text, lines, /[,;\n]+ */)
  for (i = 1; i <= count; ++i) {
    word = lines[i]
    if (word ~ /^[A-Z_0-9a-z]+ = /) {
      sub(/ .*/, "", word)
      is_constant[word] = 1
    } else {
      sub(/\[.*/, "", word)
      sub(/.*[ *]/, "", word)
      is_member[word] = 1
    }
  }
}

# ---- Prose, in sentences, with what it names as mdoc has it ---------------------------------------------------------

# Spaces within `...` do not part words.
function joined(text,    parts, count, i, all) {
  count = split(text, parts, "`")
  for (i = 1; i <= count; ++i) {
    if (i % 2 == 0) gsub(/ /, "\001", parts[i])
    all = all (i > 1 ? "`" : "") parts[i]
  }
  return all
}

function prose(text,    words, count, i) {
  gsub(/[ \n]+/, " ", text)
  sub(/^ /, "", text)
  count = split(joined(text), words, " ")
  line = ""
  for (i = 1; i <= count; ++i) {
    add_word(words[i])
    if (words[i] ~ /[.!?]\)?"?$/ && (i == count || words[i + 1] ~ /^[(`"]?[A-Z]/)) end_line()
  }
  end_line()
}

function end_line() {
  if (line != "") print line
  line = ""
}

function add_word(text,    core, before, after, macro) {
  gsub(/\001/, " ", text)
  core = text
  if (core ~ /^\(/) { before = "("; core = substr(core, 2) }
  if (match(core, /('s)?[.,;:)]*$/)) {
    after = substr(core, RSTART)
    core = substr(core, 1, RSTART - 1)
    if (core ~ /\([0-9]?$/ && after ~ /^\)/) { core = core ")"; after = substr(after, 2) }
  }
  macro = macro_of(core)
  if (macro == "") {
    gsub(/`/, "", text)
    line = line (line == "" ? "" : " ") escaped(text)
    if (line ~ /^[.']/) line = "\\&" line
    return
  }
  end_line()
  gsub(/./, " &", after)
  sub(/ ' s/, " Ap s", after)
  print "." (before == "" ? "" : "Pf ( ") macro after
}

# The mdoc macro for a word that is not just a word.
function macro_of(core,    is_quoted, is_call) {
  is_quoted = gsub(/`/, "", core) > 0
  if (core ~ /^[a-z].*\([0-9]\)$/) { sub(/\(/, " ", core); sub(/\)/, "", core); return "Xr " core }
  is_call = sub(/\(\)$/, "", core)
  if (core in is_parameter && (is_quoted || core ~ /[A-Z]/)) return "Fa " core
  if (core in function_group) return (function_group[core] in described ? "Fn " core : "Xr " core " 3")
  if (is_call || core == "syslog") return "Xr " core " 3"
  if (core in is_type) return "Vt " core
  if (core in is_constant || core ~ /^(SIG|LOG_)[A-Z]+$/) return "Dv " core
  if (core ~ /^\/[a-z].*[a-zA-Z]$/ || core ~ /^[a-z-]+-IF-.*\.[a-z]+$/) return "Pa " core
  if (core in is_member && core ~ /[a-z][A-Z]/ || is_quoted && core ~ /^[a-z]+\.[A-Za-z]+$/) return "Va " core
  if (is_quoted) return (core in is_member ? "Va " core : "Li \"" escaped(core) "\"")
  return ""
}

function escaped(text) {
  gsub(/\\/, "&e", text)
  if (text ~ /^\(?-[0-9]/) sub(/-/, "\\\\&", text)
  return text
}

function literal(text) {
  gsub(/\\/, "&e", text)
  gsub(/-/, "\\\\&", text)
  if (text ~ /^[.']/) text = "\\&" text
  print text
}

# ---- A comment: paragraphs, numbered rules, code, parameters and result ---------------------------------------------

function paragraphs(text,    lines, count, i, tags) {
  tags = "-tag -width " tag_width(text) "n -compact"
  held = list_kind = ""
  is_first = 1
  count = split(text, lines, "\n")
  for (i = 1; i <= count; ++i) {
    if (sub(/^ +[0-9]+\. /, "", lines[i])) start_item("-enum", ".It", lines[i])
    else if (sub(/^@return +/, "", lines[i])) start_item(tags, ".It Em returns", lines[i])
    else if (sub(/^@param /, "", lines[i]))
      start_item(tags, ".It Fa " first_word(lines[i]), behind_first_word(lines[i]))
    else if (lines[i] == "") {
      end_paragraph()
      if (lines[i + 1] !~ /^( +[0-9]+\. |@)/) end_list()
    } else if (held == "" && lines[i] ~ /^    /) i = show_code(lines, i)
    else held = held " " lines[i]
  }
  end_paragraph()
  end_list()
}

function start_item(kind, head, text) {
  end_paragraph()
  if (list_kind == "") print (is_first || kind == "-enum" ? "" : ".Pp\n") ".Bl " kind
  list_kind = kind
  print head
  held = text
}

function end_paragraph() {
  if (held == "") return
  if (list_kind == "" && !is_first) print ".Pp"
  prose(held)
  held = ""
  is_first = 0
}

function end_list() {
  if (list_kind != "") print ".El"
  list_kind = ""
}

# Returns the number of the line behind it.
function show_code(lines, i) {
  print ".Bd -literal -offset indent"
  for (; lines[i] ~ /^    /; ++i) literal(substr(lines[i], 5))
  print ".Ed"
  return i
}

function first_word(text) { return substr(text, 1, index(text " ", " ") - 1) }

function behind_first_word(text) {
  sub(/^[^ ]+ +/, "", text)
  return text
}

# Of what is said of a function: the longest parameter.
function tag_width(text,    lines, count, i, widest) {
  widest = length("returns")
  count = split(text, lines, "\n")
  for (i = 1; i <= count; ++i)
    if (sub(/^@param /, "", lines[i]) && length(first_word(lines[i])) > widest) widest = length(first_word(lines[i]))
  return widest
}

# ---- Functions and types --------------------------------------------------------------------------------------------

# Each of the parameters, without the parentheses; "void" for none.
function parameters(code, list) {
  sub(/^[^(]*\(/, "", code)
  sub(/\);.*/, "", code)
  return split(code, list, ", ")
}

function synopsis(i,    code, list, count, k, type) {
  code = type = item_code[i]
  count = parameters(code, list)
  sub(/\(.*/, "", type)
  sub(item_name[i] "$", "", type)
  sub(/ $/, "", type)
  print ".Ft " (type ~ / / ? "\"" type "\"" : type)
  type = ".Fn " item_name[i]
  for (k = 1; k <= count; ++k) type = type (list[k] == "void" ? " void" : " \"" list[k] "\"")
  print type
}

function describe_function(i,    list, count, k, name) {
  count = parameters(item_code[i], list)
  split("", is_parameter)
  for (k = 1; k <= count; ++k) {
    name = list[k]
    sub(/.*[ *]/, "", name)
    is_parameter[name] = 1
  }
  print ".It Fn " item_name[i]
  paragraphs(item_text[i])
  split("", is_parameter)
}

# A row for each constant or member, with what is told of it.
function describe_rows(text, is_enum,    rows, count, i, told, within, held, held_count, k) {
  gsub(/\n +\/\*\*</, " /**<", text)
  count = split(text, rows, "\n")
  print ".Bl -tag -width Ds -compact"
  for (i = 1; i <= count; ++i) {
    while (rows[i] ~ /\/\*\*</ && rows[i] !~ /\*\//) { rows[i + 1] = rows[i] " " rows[i + 1]; ++i }
    told = ""
    if (match(rows[i], /\/\*\*<.*\*\//)) {
      told = substr(rows[i], RSTART + 5, RLENGTH - 7)
      rows[i] = substr(rows[i], 1, RSTART - 1)
    }
    sub(/^ +/, "", rows[i])
    sub(/[ ,;]+$/, "", rows[i])
    if (rows[i] == "union {") { held_count = 0; within = 1; continue }
    if (within && rows[i] ~ /^[}]/) {
      sub(/[}] /, "", rows[i])
      for (k = 1; k <= held_count; ++k) {
        sub(/[^ ]+$/, rows[i] ".&", held[k])
        row("Li \"" held[k] "\"", held_told[k])
      }
      within = 0
    } else if (within) {
      held[++held_count] = rows[i]
      held_told[held_count] = told
    } else if (rows[i] != "") row(is_enum ? "Dv " rows[i] : "Li \"" rows[i] "\"", told)
  }
  print ".El"
}

function row(head, told) {
  print ".It " head
  prose(told)
}

function describe_type(i,    code, names, count, k, heading) {
  code = heading = item_code[i]
  count = split(item_name[i], names, " ")
  sub(/^typedef /, "", heading)
  sub(/ .*/, "", heading)
  heading = heading " " names[1]
  for (k = 2; k <= count; ++k) if (names[k] != names[1]) heading = heading " , " names[k]
  print ".It Vt " heading
  paragraphs(item_text[i])
  if (sub(/^[^{]*[{]\n?/, "", code)) {
    if (item_kind[i] == "enum" && code !~ /\n./) gsub(/, /, "\n", code)
    sub(/[}][^}]*$/, "", code)
    print ".Pp"
    describe_rows(code, item_kind[i] == "enum")
  }
}

function describe(of,    i, in_list) {
  for (i = 1; i <= items; ++i) {
    if (item_group[i] != of) continue
    if (item_kind[i] == "prose") {
      print (in_list ? ".El\n" : "") ".Pp"
      in_list = 0
      paragraphs(item_text[i])
      continue
    }
    if (!in_list) print ".Bl -tag -width Ds"
    in_list = 1
    if (item_kind[i] == "function") describe_function(i)
    else describe_type(i)
  }
  if (in_list) print ".El"
}

# ---- The page -------------------------------------------------------------------------------------------------------

# The groups that a line of the page is about.
function groups_of(of, list,    i, count) {
  split("", list)
  for (i = 1; i <= group_count; ++i)
    if (groups[i] == of || header_of[groups[i]] == of) list[++count] = groups[i]
  if (count) return count
  print FILENAME ": there is no group " of > "/dev/stderr"
  exit_status = 1
  return 0
}

function list_names(of,    list, count, i, k, n, names_of, some, found) {
  count = groups_of(of, list)
  for (k = 1; k <= count; ++k)
    for (i = 1; i <= items; ++i) {
      if (item_group[i] != list[k]) continue
      some = split(item_name[i], names_of, " ")
      for (n = 1; n <= some; ++n)
        if (names_of[n] ~ /^P?(MERO|PLIB|WIRELESS_)/ && !(names_of[n] in found)) {
          found[names_of[n]] = 1
          line = line (line == "" ? "" : " ,\n") ".Nm " names_of[n]
        }
    }
  end_line()
}

function synopses(of,    list, count, i, k) {
  count = groups_of(of, list)
  for (k = 1; k <= count; ++k) {
    if (count > 1) print ".Ss " list[k]
    for (i = 1; i <= items; ++i) if (item_group[i] == list[k] && item_kind[i] == "function") synopsis(i)
  }
}

function descriptions(of,    list, count, k) {
  count = groups_of(of, list)
  for (k = 1; k <= count; ++k) {
    if (count > 1) print ".Ss " list[k]
    describe(list[k])
  }
}

# Without what the header says of itself above them.
function all_rules(of,    text) {
  text = rules[of]
  sub(/^.*:\n\n/, "", text)
  paragraphs(text)
}

END {
  for (i = 1; i <= page_lines; ++i)
    if (page[i] ~ /^@describe /) {
      count = groups_of(substr(page[i], 11), list)
      for (k = 1; k <= count; ++k) described[list[k]] = 1
    }
  for (i = 1; i <= page_lines; ++i) {
    of = page[i]
    sub(/^@[a-z]+ */, "", of)
    if (page[i] ~ /^@names /) list_names(of)
    else if (page[i] ~ /^@synopsis /) synopses(of)
    else if (page[i] ~ /^@rules /) all_rules(of)
    else if (page[i] ~ /^@describe /) descriptions(of)
    else if (page[i] == "@example") {
      print ".Bd -literal"
      while (page[++i] != "@end" && i <= page_lines) literal(page[i])
      print ".Ed"
    } else print page[i]
  }
  exit exit_status
}
