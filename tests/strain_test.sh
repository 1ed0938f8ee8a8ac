#!/usr/bin/env bash
# The program under strain: what no user should do to it.
# usage: tests/strain_test.sh PROGRAM
set -euo pipefail

program=$(realpath "$1")
scratch=$(mktemp -d)
trap 'rm -rf "$scratch"' EXIT
cd "$scratch"

fail() { echo "strain_test: $*" >&2; exit 1; }

expect_status() {  # STATUS WHAT COMMAND ...: what it prints is of no interest
  local expected=$1 what=$2 status=0
  shift 2
  timeout 100 env --default-signal "$@" >/dev/null 2>err || status=$?
  [ "$status" = "$expected" ] || fail "$what: status $status, not $expected: $(head -c 500 err)"
}

head -c $((1 << 20)) /dev/zero | tr '\0' '\n' >largest
expect_status 0 "the largest profile" env ZUB_DEVICE=largest "$program" help
(cat largest && echo) >larger
for profile in 'none:0: No such file or directory' '.:0: Is a directory' 'larger:0: larger than a profile may be'; do
  expect_status 255 "$profile" env ZUB_DEVICE="${profile%%:*}" "$program" help
  grep -qx "$profile" err || fail "not so: $profile"
done
expect_status 0 "standard output without a reader" \
  bash -c 'set -o pipefail; "$0" help | true' "$program"
expect_status 0 "a limit to a file's size" sh -c 'ulimit -f 0; "$0" help >full' "$program"
expect_status 0 "full standard output" sh -c '"$0" logdump tel >/dev/full' "$program"
expect_status 1 "standard input that cannot be read" sh -c '"$0" </' "$program"
expect_status 1 "too many words" \
  sh -c 'ulimit -v 600000; (yes x | head -n 20000000 | tr "\n" " "; echo; echo quit) | "$0"' "$program"
[ "$(cat err)" = 'Not enough memory' ] || fail "too many words: $(cat err)"
expect_status 1 "too long a line" \
  sh -c 'ulimit -v 600000; (head -c 500000000 /dev/zero | tr "\0" a; echo; echo quit) | "$0"' "$program"
[ ! -s err ] || fail "too long a line: $(cat err)"
expect_status 0 "100,000 groups" "$program" $(yes 'help --' | head -n 50000)

# However little memory there is, a start ends with a message and a status.
ulimit -c 0
: >errors
for ((kib = 4096; kib < 65536; kib += 16)); do
  ! grep -q 'Cannot connect' errors || break  # enough for all but a last thread
  ! grep -q 'shell thread' errors || ((kib += 496))  # from here on it lacks whole stacks
  status=0
  (ulimit -v $kib && exec "$program" back) >out 2>err || status=$?
  cat err >>errors
  read -r why <err || true
  [[ ! -s out && "$status $why" =~ ^(127 |255 Cannot start|1 Not enough memory$|1 Cannot connect) ]] ||  # 127: the loader's
    fail "with $kib KiB: status $status: $why"
done
for refusal in 'Cannot start: not enough memory' \
  'Cannot '{'start the shell thread','connect to the server: no thread'}': Resource temporarily unavailable'; do
  grep -qx "$refusal" errors || fail "never: $refusal"
done
