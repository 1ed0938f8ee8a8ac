#!/usr/bin/env bash
# Compares completions and the manual page with the words that the program itself takes.
# usage: tests/docs_test.sh PROGRAM   (the path of zubtool)
set -euo pipefail
export LC_ALL=C

program=$1
sources=$(cd "$(dirname "$0")/.." && pwd)
failed=0

wrong() {
  echo "docs_test: $*" >&2
  failed=1
}

fail() {
  wrong "$@"
  exit 1
}

# Prints what the pattern finds in standard input, one a line; nothing is no failure.
find_all() {  # PATTERN
  grep -oP -- "$1" || [[ $? == 1 ]]
}

# Prints the lines of a text as a set.
set_of() {  # TEXT
  sed '/^$/d' <<<"$1" | sort -u
}

check_same() {  # WHAT EXPECTED ACTUAL
  diff <(set_of "$2") <(set_of "$3") >&2 || wrong "$1"
}

help_of() {  # [COMMAND]
  ZUB_DEVICE='' "$program" "$@" help </dev/null
}

# Words that the tree takes behind others: handlers behind "zubtool logdump", options behind
# "zubtool logdump tel".
declare -A tree

read_tree() {
  local help command handler text
  help=$(help_of) || fail "'zubtool help' ends with status $?"
  tree[zubtool]=$(find_all '^\t +\K\S+' <<<"$help")$'\nexit'  # which the help does not show
  tree[zubtool cd]=$(find_all '^\t +\K\S+(?=  -  \[)' <<<"$help")
  for command in ${tree[zubtool cd]}; do
    help=$(help_of "$command") || fail "'zubtool $command help' ends with status $?"
    tree[zubtool $command]=$(find_all '^\t +\K\S+(?=  -  [^<])' <<<"$help")
    for handler in ${tree[zubtool $command]}; do
      text=$(find_all "^\t +\Q$handler\E  -  \K.*" <<<"$help")
      tree[zubtool $command $handler]=$(find_all '[[|]\K[a-z.]+(?=[]|])| \K-[a-z](?= )' <<<"$text")
    done
    tree[zubtool $command]+=$'\nhelp'
  done
}

# Prints what the completion for a shell offers behind a line.
offered() {  # SHELL LINE
  local typed
  read -ra typed <<<"$2"
  "$sources/tests/completions.sh" "$1" "${typed[@]:1}"
}

check_offer() {  # SHELL LINE EXPECTED
  local actual
  actual=$(offered "$1" "$2") || wrong "completions.sh for $1 fails behind '$2'"
  check_same "$1 should offer other words (<) behind '$2' than it does (>)" "$3" "$actual"
}

check_completion() {  # SHELL
  local path line words
  for path in "${!tree[@]}"; do
    line=$path
    words=${tree[$path]}
    if grep -qx -e -p <<<"$words"; then line+=' 600 out.txt'; fi
    if [[ $path == *' '*' '* ]]; then words+=$'\n--'; fi
    check_offer "$1" "$line" "$words"
  done
  check_offer "$1" 'zubtool logdump bb NONUI Tar tar.gz nocompress' \
    "${tree[zubtool logdump bb]-}"$'\n--'
  check_offer "$1" 'zubtool logdump tel why' '--'
  check_offer "$1" 'zubtool logdump tel -- cd' "${tree[zubtool cd]}"
}

check_words() {
  local page=$sources/docs/zubtool.1 named letters
  named=$(find_all '\b(Ic|Cm) \K\S+' <"$page")
  letters=$(find_all '\bFl \K[a-z]' <"$page" | sed 's/^/-/')
  check_same 'zubtool(1) should name other words (<) than it does (>)' \
    "$(printf '%s\n' "${tree[@]}")" "$named"$'\n'"$letters"
}

read_tree
for shell in bash zsh fish; do
  if command -v "$shell" >/dev/null; then
    check_completion "$shell"
  else
    echo "not run: the completion for $shell: it is not installed"
  fi
done
check_words
exit "$failed"
