#!/usr/bin/env bash
# Prints what the completion for a shell offers behind words, one a line.
# usage: tests/completions.sh bash|zsh|fish [word ...]
set -euo pipefail

shell=$1
shift
cd "$(dirname "$0")/../completions"
case $shell in
  bash)
    compopt() { :; }
    source ./zubtool.bash
    COMP_WORDS=(zubtool "$@" '')
    COMP_CWORD=$(($# + 1))
    _zubtool
    printf '%s\n' "${COMPREPLY[@]}"
    ;;
  zsh)
    zsh -fc '
      _describe() { print -rl -- "${(@)offered%%:*}" }
      _files() { : }
      words=(zubtool "$@" "")
      CURRENT=$#words
      source ./_zubtool' zsh "$@"
    ;;
  fish)
    HOME=/dev/null fish --no-config -c '
      source ./zubtool.fish
      complete -C "zubtool $argv " | string replace -r "\t.*" ""; true' -- "$@"
    ;;
esac
