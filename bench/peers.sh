#!/usr/bin/env bash
# The same entries, printed by journalctl and exported by zubtool, from six journal files and from
# a recorded log. Needs systemd-journal-remote and a release build with libsystemd.
# usage: bench/peers.sh [MESSAGES [RUNS]]
set -euo pipefail

messages=${1:-1000000}
runs=${2:-5}
top=$(cd "$(dirname "$0")/.." && pwd)
tool=$top/build/release/tool/zubtool
remote=$(command -v systemd-journal-remote || echo /lib/systemd/systemd-journal-remote)
[ -x "$remote" ] || { echo "peers.sh: please install systemd-journal-remote" >&2; exit 1; }

work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT
mkdir "$work/journal"
"$top/build/release/bench/make_log" "$messages" "$work/log"
awk -v each=$((messages / 6 + 1)) -v to="$work/part" '
  BEGIN { RS = ""; ORS = "\n\n" } { print > (to int((NR - 1) / each)) }' "$work/log"
for part in "$work"/part*; do
  "$remote" --output="$work/journal/${part##*/}.journal" "$part" >/dev/null 2>&1
  rm "$part"
done
echo "log = ./journal" >"$work/folder"
echo "log = ./log" >"$work/recorded"

theirs() { journalctl -D "$work/journal" --no-pager -q -o "$@" >"$work/out"; }
ours() { ZUB_DEVICE=$work/$1 "$tool" logdump oslog 2147483647 "$work/out" "${@:2}"; }
starts() { "$tool" --; }

# Each line of `rivals` is a name and a command; the runs of all take turns. Prints the medians of
# wall and processor time, without what a start of the tool takes.
measure() {  # WHAT
  local i name command
  echo "$1, in seconds without start-up:"
  for ((i = 0; i < runs; i++)); do
    while IFS=: read -r name command; do
      TIMEFORMAT="%R %U %S"
      { time $command; } 2>"$work/time"
      echo "$name:$(tail -n 1 "$work/time"):$(wc -l <"$work/out")"
    done <<<"$rivals"
  done | sort -t: -k1,1 -s | awk -F: -v start="${start_up:-0}" '
    function median(list, n,  i, j, t) {
      for (i = 2; i <= n; i++) for (j = i; j > 1 && list[j] < list[j-1]; j--) {
        t = list[j]; list[j] = list[j-1]; list[j-1] = t
      }
      return list[int((n + 1) / 2)]
    }
    function show() {
      if (n) printf "  %-28s wall %6.2f  processor %6.2f  lines %d\n", last,
                    median(wall, n) - (last ~ /zubtool/ ? start : 0), median(used, n), lines
      n = 0
    }
    $1 != last { show(); last = $1 }
    { split($2, t, " "); wall[++n] = t[1]; used[n] = t[2] + t[3]; lines = $3 }
    END { show() }'
}

rivals='tool:starts'
: >"$work/out"
start_up=$(measure start | awk '/tool/ { print $3 }')
echo "start-up of zubtool, which waits for a server: $start_up s"

rivals='journalctl -o short:theirs short
journalctl -o export:theirs export
zubtool, folder:ours folder all
zubtool, recorded log:ours recorded all'
measure "Everything"

rivals='journalctl -o short _COMM=:theirs short _COMM=sshd
zubtool -p, folder:ours folder -p sshd
zubtool -i, folder:ours folder -i sshd
zubtool -p, recorded log:ours recorded -p sshd'
measure "One process in eight"

rivals='zubtool, folder:ours folder -p nobody -i nowhere
zubtool, recorded log:ours recorded -p nobody -i nowhere'
measure "Nothing that matches"
