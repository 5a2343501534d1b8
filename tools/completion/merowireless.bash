# Completion of merowireless for bash.

# The names of the known networks, quoted; those in range would take a scan. Left out are those that would be options,
# and those with characters that cannot be typed: the program writes them out, or they are quoted as $'...'.
_merowireless_names() {
  local line name
  while IFS= read -r line; do
    name=${line%%$'\t'*}
    [[ ${name//\\\\/} != *\\0* ]] || continue
    printf -v name %b "$name"
    printf -v name %q "$name"
    [[ $name == [-\$\']* ]] || printf '%s\n' "$name"
  done < <(merowireless --porcelain known 2>/dev/null </dev/null)
}

# The help of the program or a command says all that may follow. It is read as it is on a wide screen.
_merowireless_help() { # [COMMAND]
  # shellcheck disable=SC2086  # a command is one word or two
  COLUMNS=0 merowireless $1 --help 2>/dev/null </dev/null
}

# What the help that it reads has under a heading, a row each: a name, and what it takes.
_merowireless_listed() { # HEADING
  local heading line
  while IFS= read -r line; do
    if [[ $line == [A-Z]*: ]]; then
      heading=$line
    elif [[ $heading == "$1:" && $line =~ ^'  '([^ ]+)(' '([^ ]+))? ]]; then
      echo "${BASH_REMATCH[1]##*,} ${BASH_REMATCH[3]}"
    fi
  done
}

# The names alone, but for that of --help, which every command has.
_merowireless_names_listed() { # HEADING
  local name _
  while read -r name _; do [[ $name == --help ]] || echo "$name"; done < <(_merowireless_listed "$1")
}

# What the value of an option may be, by the help that it reads; fails for options that take none.
_merowireless_takes() { # OPTION
  local option takes
  while read -r option takes; do
    [[ $option != "$1" || ! $takes || $takes == Excludes: ]] || echo "$takes"
  done < <(_merowireless_listed Options) | grep .
}

# The words among what may be given; others stand for what they say.
_merowireless_choices() { # TAKES
  local word
  for word in ${1//[][|]/ }; do
    case $word in
      NAME | ADDRESS | FILE | N | CC | A.B.C.D) ;;
      *) echo "$word" ;;
    esac
  done
}

# What may stand at some place of a command.
_merowireless_words() { # COMMAND ITS-HELP CURRENT-WORD
  local _ takes
  # Options of all commands are offered once one is begun.
  [[ $3 != -* ]] || { _merowireless_help | _merowireless_names_listed Options && echo --help; }
  _merowireless_names_listed Subcommands <<<"$2"
  [[ ! $1 ]] || _merowireless_names_listed Options <<<"$2"
  while read -r _ takes; do _merowireless_choices "$takes"; done < <(_merowireless_listed Positionals <<<"$2")
  [[ $1 != @(connect|forget|share) ]] || _merowireless_names
}

# Writes how the words that it reads go on after a beginning that has been typed, which may have opened quotes.
_merowireless_rest() { # TYPED
  local word char
  while IFS= read -r word; do
    case $1 in
      \"*)
        for char in \\ \" \$ \`; do word=${word//"$char"/"\\$char"}; done
        word=\"${word//!/'"\!"'}\" # not even a backslash keeps the history out of these quotes
        ;;
      \'*) word=${word@Q} ;;
      *) printf -v word %q "$word" ;;
    esac
    [[ $word != "$1"* ]] || printf '%s\n' "${word#"$1"}"
  done
}

_merowireless() { # PROGRAM REPLACED, which is the end of the current word: bash replaces no more than that
  # Bash takes words apart at colons and the like; what has no blank between is one word. The last ends at the cursor.
  local rest=" ${COMP_LINE:0:COMP_POINT}" words=() part
  for part in "${COMP_WORDS[@]:0:COMP_CWORD}" ''; do
    [[ $rest != [[:space:]]* ]] || words+=('')
    rest=${rest#"${rest%%[![:space:]]*}"}
    part=${part:-$rest}
    words[-1]+=$part
    rest=${rest#"$part"}
  done

  local command='' word
  for word in "${words[@]:1:${#words[@]}-2}"; do
    case $command:$word in
      *:-*) ;;
      :*) command=$word ;;
      ap:*) command="ap $word" ;;
    esac
  done

  local current=${words[-1]} option=${words[-2]} value=${words[-1]} help takes offered
  [[ $current != --*=* ]] || option=${current%%=*} value=${current#*=}
  help=$(_merowireless_help "$command")
  if takes=$(_merowireless_takes "$option" <<<"$help"); then
    if [[ $takes == FILE* ]]; then
      COMPREPLY=()
      compopt -o default # the names of files
      return
    fi
    offered=$(_merowireless_choices "$takes")
    current=$value
  elif [[ $current != -* ]] && _merowireless_listed Positionals <<<"$help" | grep -q ' \[\{0,1\}FILE'; then
    COMPREPLY=()
    compopt -o default # the names of files
    return
  else
    offered=$(_merowireless_words "$command" "$help" "$current")
  fi
  mapfile -t COMPREPLY < <(compgen -W "$offered" -- "$current" | _merowireless_rest "${current%"$2"}")
}

complete -F _merowireless merowireless
