#!/usr/bin/env bash
# The same entries, printed by journalctl from journal files and exported by zubtool from a recorded
# log: everything, and one process in eight. Needs systemd-journal-remote and a release build.
# usage: bench/peers.sh [MESSAGES [RUNS]]
set -euo pipefail

messages=${1:-1000000}
runs=${2:-5}
top=$(cd "$(dirname "$0")/.." && pwd)
remote=$(command -v systemd-journal-remote || echo /lib/systemd/systemd-journal-remote)
[ -x "$remote" ] || { echo "peers.sh: please install systemd-journal-remote" >&2; exit 1; }

work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT
mkdir "$work/journal"
"$top/build/release/bench/make_log" "$messages" "$work/log"
echo "log = $work/log" >"$work/device"
"$remote" --output="$work/journal/all.journal" "$work/log" >/dev/null 2>&1

journalctl_run() { journalctl -D "$work/journal" -o short --no-pager -q "$@" >"$work/theirs"; }
zubtool_run() {
  ZUB_DEVICE=$work/device "$top/build/release/tool/zubtool" logdump oslog 2147483647 "$work/ours" "$@"
}

seconds() {  # COMMAND ...: the median wall time of its runs
  for ((i = 0; i < runs; i++)); do
    local start=$EPOCHREALTIME
    "$@" >&2
    echo "$start $EPOCHREALTIME"
  done | awk '{ print $2 - $1 }' | sort -n | sed -n "$(((runs + 1) / 2))p"
}

compare() {  # WHAT journalctl-words -- zubtool-words
  local what=$1 theirs ours
  shift
  local words=()
  while [ "$1" != -- ]; do words+=("$1"); shift; done
  shift
  theirs=$(seconds journalctl_run "${words[@]}")
  ours=$(seconds zubtool_run "$@")
  awk -v start="$start_up" -v what="$what" -v theirs="$theirs" -v ours="$ours" -v lines="$(wc -l <"$work/ours")" -v other="$(wc -l <"$work/theirs")" '
    BEGIN { printf "%-12s journalctl %.2f s (%d lines), zubtool %.2f s (%d lines): %.1f times as fast, %.1f without its start-up of %.2f s\n",
      what, theirs, other, ours, lines, theirs / ours, theirs / (ours - start), start }'
}

# Half a second of waiting for the server, which journalctl has nothing to set against.
start_up=$(seconds "$top/build/release/tool/zubtool" --)

compare everything -- all
compare one-in-8 _COMM=sshd -- -p sshd
