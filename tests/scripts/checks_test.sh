#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# Runs small sets of checks, good and bad, and looks at the counts and at the exit status.
#
#   checks_test.sh SCRIPTS-FOLDER

set -euo pipefail

scripts=$1
folder=$(mktemp -d)
trap 'rm -rf "$folder"' EXIT
failures=0

# write_set TEXT: makes a script of these checks.
write_set() {
  printf '%s\n' ". '$scripts/lib.sh'" ". '$scripts/checks.sh'" "$1" >"$folder/set.sh"
}
# run_set TEXT: makes and runs one; its status is in $status, what it said in $said.
run_set() {
  write_set "$1"
  status=0
  said=$(TMPDIR=$folder bash "$folder/set.sh" 2>&1) || status=$?
}

# fault TEXT: counts what was not as expected.
fault() {
  printf '%s\n' "$1"
  failures=$((failures + 1))
}

# expect NAME STATUS COUNTS: about the set that ran last. Nothing of it may be left in the folder.
expect() {
  local name=$1 expected=$2 counts=$3
  [ "$status" -eq "$expected" ] || fault "$name: status $status, expected $expected; said: $said"
  grep -qxF "$counts" <<<"$said" || fault "$name: expected \"$counts\", said: $said"
  [ "$(ls "$folder")" = set.sh ] || fault "$name: left behind: $(ls "$folder")"
}

run_set 'check one true; check two true; give_verdict'
expect "all passed" 0 "2 passed, 0 failed"

run_set 'check one false; check two true; give_verdict'
expect "one failed, the next one ran" 1 "1 passed, 1 failed"

run_set 'beside() { check two true; check three true; }
check four true; begin_beside 2 beside; check one true; await_beside; give_verdict'
expect "all passed, some beside" 0 "4 passed, 0 failed"

run_set 'beside() { check two false; check three true; }
begin_beside 2 beside; check one true; await_beside; give_verdict'
expect "one beside failed" 1 "2 passed, 1 failed"

run_set 'beside() { exit 0; }
begin_beside 2 beside; check one true; await_beside; give_verdict'
expect "those beside ended early" 1 "1 passed, 2 failed"

run_set 'beside() { check two sleep 0.2; }
begin_beside 1 beside; check one true; await_beside; give_verdict'
expect "the one beside takes longer" 0 "2 passed, 0 failed"

# Ended from outside, it ends what runs beside, and tells so by its status.
write_set "beside() { check two bash -c 'echo \$\$ >\"$folder/beside_id\"; exec sleep 60'; }
begin_beside 1 beside; check one sleep 1; await_beside; give_verdict"
TMPDIR=$folder bash "$folder/set.sh" >/dev/null 2>&1 &
set_job=$!
for _ in $(seq 600); do [ -s "$folder/beside_id" ] && break || sleep 0.05; done
beside_id=$(cat "$folder/beside_id")
kill "$set_job"
status=0
wait "$set_job" || status=$?
[ "$status" -eq 143 ] || fault "ended from outside: status $status, expected 143"
for _ in $(seq 100); do kill -0 "$beside_id" 2>/dev/null || break; sleep 0.05; done
if kill -0 "$beside_id" 2>/dev/null; then
  fault "ended from outside: what ran beside goes on"
fi

echo "checks_test: $failures failures"
[ "$failures" -eq 0 ]
