#!/usr/bin/env bash
# The program under strain: a long run, and what no user should do to it.
# usage: tests/strain_test.sh PROGRAM
set -euo pipefail

program=$(realpath "$1")
scratch=$(mktemp -d)
trap 'rm -rf "$scratch"' EXIT
cd "$scratch"

fail() {
  echo "strain_test: $*" >&2
  exit 1
}

expect_status() {  # STATUS WHAT COMMAND ...: what it prints is of no interest
  local expected=$1 what=$2 status=0
  shift 2
  timeout 100 "$@" >/dev/null 2>err || status=$?
  [ "$status" = "$expected" ] || fail "$what: status $status, not $expected: $(head -c 500 err)"
}

# One round of commands: a group of four lines that the model below knows.
commands() { for ((i = 0; i < $1; i++)); do printf 'logdump tel r\nlogdump core\nbogus -- help\nlogdump bb tar\n'; done; }

# The memory that the program holds, in KiB, once all that has been typed is done.
settled_memory() {  # PROCESS FILE-OF-OUTPUT PROMPTS
  local deadline=$((SECONDS + 100))
  until [ "$(grep -o '(/zubtool)>> ' "$2" | wc -l)" -ge "$3" ]; do
    [ $SECONDS -lt $deadline ] || fail "the program does not get on"
    sleep 0.1
  done
  sed -n 's/^VmRSS:[^0-9]*\([0-9]*\).*/\1/p' "/proc/$1/status"
}

soak() {
  local rounds=2500 early late
  echo 'dump-timestamp = T' >device
  mkfifo typed
  ZUB_DEVICE=device "$program" <typed >out 2>err &
  local process=$!
  exec 3>typed
  commands $((rounds / 5)) >&3
  early=$(settled_memory $process out $((4 * rounds / 5 + 1)))
  commands $((rounds - rounds / 5)) >&3
  late=$(settled_memory $process out $((4 * rounds + 1)))
  echo quit >&3
  exec 3>&-
  wait $process || fail "the long run: status $?"
  [ "$late" -le $((early + 256)) ] || fail "memory grows from $early to $late KiB"
  { commands 1; echo quit; } | ZUB_DEVICE=device "$program" >round
  for ((i = 0; i < rounds; i++)); do head -c -13 round; done >expected  # less the last prompt
  printf '(/zubtool)>> ' >>expected
  cmp out expected >&2 || fail "the long run prints something else"
  [ ! -s err ] || fail "the long run complains: $(head -n 3 err)"
}

soak

expect_status 255 "no such profile" env ZUB_DEVICE=none "$program" help
expect_status 0 "standard output without a reader" \
  bash -c 'set -o pipefail; "$0" logdump tel | true' "$program"
expect_status 0 "full standard output" sh -c '"$0" logdump tel >/dev/full' "$program"
expect_status 1 "a line of 100 MB" sh -c 'head -c 100000000 /dev/zero | tr "\0" a | "$0"' "$program"
for line in 'yes x | head -n 20000000 | tr "\n" " "' 'head -c 500000000 /dev/zero | tr "\0" a'; do
  expect_status 0 "$line" sh -c "ulimit -v 600000; { $line; echo; echo quit; } | '$program'"
  grep -qx 'Not enough memory for this line' err || fail "$line: not refused"
done
expect_status 0 "100,000 groups" "$program" $(yes 'help --' | head -n 50000)
expect_status 1 "arbitrary bytes" sh -c 'head -c 1000000 "$0" | "$0"' "$program"

# However little memory there is, a start ends with a message and a status.
ulimit -c 0
: >errors
for ((kib = 4096; kib < 65536; kib += 16)); do
  ! grep -q 'shell thread' errors || break  # enough for the start itself
  status=0
  (ulimit -v $kib && exec "$program" bogus) >/dev/null 2>err || status=$?
  [[ $status =~ ^(127|255)$ && -s err ]] || fail "with $kib KiB: status $status"  # 127: the loader's
  cat err >>errors
done
grep -qx 'Cannot start: not enough memory' errors || fail "memory is never too little to start"
