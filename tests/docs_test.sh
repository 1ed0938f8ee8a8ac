#!/usr/bin/env bash
# Compares completions and manual pages with the words that the program itself takes.
# usage: tests/docs_test.sh PROGRAM   (the path of zubtool)
set -eEuo pipefail
export LC_ALL=C ZUB_DEVICE=

program=$(realpath "$1")
cd "$(dirname "$0")/../completions"
failed=0
trap 'echo "docs_test: line $LINENO fails" >&2' ERR

# Prints what the pattern finds in standard input, one a line; nothing is no failure.
find_all() { grep -oP -- "$1" || [[ $? == 1 ]]; }  # PATTERN

check_same() {  # WHAT EXPECTED ACTUAL: two sets of lines
  diff <(sort -u <<<"$2" | sed '/^$/d') <(sort -u <<<"$3" | sed '/^$/d') >&2 && return
  echo "docs_test: $1" >&2
  failed=1
}

# Prints what the completion for a shell offers after words, one a line.
offers_of_bash() (
  trap - ERR  # to offer nothing is no fault
  compopt() { :; }
  source ./zubtool.bash
  COMP_WORDS=("$@" '') COMP_CWORD=$#
  _zubtool
  printf '%s\n' "${COMPREPLY[@]}"
)
offers_of_zsh() {
  zsh -fc '_describe() { print -rl -- "${(@)offered%%:*}" }
    _files() { : }
    words=("$@" "") CURRENT=$#words
    source ./_zubtool' zsh "$@"
}
offers_of_fish() {
  HOME=/dev/null fish --no-config -c 'source ./zubtool.fish
    complete -C "$argv " | string replace -r "\t.*" ""; true' -- "$@"
}

check_offer() {  # SHELL LINE EXPECTED
  check_same "$1 should offer other words (<) after '$2' than it does (>)" "$3" "$("offers_of_$1" $2)"
}

# Words that the tree takes after others: handlers after "zubtool logdump", options after
# "zubtool logdump tel".
declare -A tree
help=$("$program" help)
tree[zubtool]=$(find_all '^\t +\K\S+' <<<"$help")$'\nexit'  # which the help does not show
tree[zubtool cd]=$(find_all '^\t +\K\S+(?=  -  \[)' <<<"$help")
for command in ${tree[zubtool cd]}; do
  help=$("$program" "$command" help)
  tree[zubtool $command]=$(find_all '^\t +\K\S+(?=  -  [^<])' <<<"$help")
  for handler in ${tree[zubtool $command]}; do
    text=$(find_all "^\t +\Q$handler\E  -  \K.*" <<<"$help")
    tree[zubtool $command $handler]=$(find_all '[[|]\K[a-z.]+(?=[]|])| \K-[a-z](?= )' <<<"$text")
  done
  tree[zubtool $command]+=$'\nhelp'
done

for shell in bash zsh fish; do
  command -v "$shell" >/dev/null || { echo "not run: the completion for $shell: it is not installed"; continue; }
  for path in "${!tree[@]}"; do
    line=$path
    words=${tree[$path]}
    if grep -qx -e -p <<<"$words"; then line+=' 600 out.txt'; fi
    if [[ $path == *' '*' '* ]]; then words+=$'\n--'; fi
    check_offer "$shell" "$line" "$words"
  done
  check_offer "$shell" 'zubtool logdump bb NONUI Tar tar.gz nocompress' "${tree[zubtool logdump bb]-}"$'\n--'
  check_offer "$shell" 'zubtool logdump tel why' ''
  check_offer "$shell" 'zubtool logdump oslog 600 out.txt -p a -i' ''
  check_offer "$shell" 'zubtool logdump tel -- cd' "${tree[zubtool cd]}"
done
named=$(find_all '\b(Ic|Cm) \K\S+|\bFl \K[a-z]' <../docs/zubtool.1 | sed 's/^.$/-&/')
check_same 'zubtool(1) should name other words (<) than it does (>)' "$(printf '%s\n' "${tree[@]}")" "$named"

check_same 'the keys and defaults of zub-device(5) should be those (<) of phone.device' \
  "$(sed 's/ *#.*//; s/ = / No = /' ../devices/phone.device)"$'\nrequest-log' \
  "$(sed -n 's/^\.It Ic //p' ../docs/zub-device.5)"
check_same 'the keys of zub-device(5) should be those (<) that a profile may set' \
  "$(find_all '^    \{"\K[a-z-]+(?=", )' <../platform/host/device/Profile.cpp)" \
  "$(find_all '^\.It Ic \K\S+' <../docs/zub-device.5)"
exit "$failed"
