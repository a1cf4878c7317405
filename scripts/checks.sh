# SPDX-License-Identifier: Apache-2.0
# Runs checks, counts them, and gives a verdict on all. Sourced behind lib.sh, never run.

passed=0
failed=0
checks_began=$(date +%s)

# check NAME COMMAND...: runs one check, counts it, goes on either way.
check() {
  local name=$1 begun
  begun=$(date +%s)
  shift
  if "$@"; then
    passed=$((passed + 1))
    say "$name: ok after $(($(date +%s) - begun)) s"
  else
    failed=$((failed + 1))
    say "$name: FAILED after $(($(date +%s) - begun)) s"
  fi
}

# begin_beside COUNT FUNCTION: the function runs COUNT checks beside those that follow, in what they
# leave of the processors. What it prints comes when it is awaited.
begin_beside() {
  beside_count=$1
  beside_folder=$(mktemp -d)
  # A process group of its own can be ended whole.
  set -m
  (
    passed=0
    failed=0
    chrt --idle --pid 0 "$BASHPID"
    "$2"
    echo "$passed $failed" >"$beside_folder/counts"
  ) >"$beside_folder/log" 2>&1 </dev/null &
  beside_job=$!
  set +m
  trap end_beside EXIT
  trap 'exit 130' INT
  trap 'exit 143' TERM
}

# await_beside: prints what the checks beside said, and counts them. One that did not come to its end
# has failed.
await_beside() {
  local counts=(0 "$beside_count")
  wait "$beside_job" || true
  cat "$beside_folder/log"
  if [ -s "$beside_folder/counts" ]; then read -ra counts <"$beside_folder/counts"; fi
  passed=$((passed + counts[0]))
  failed=$((failed + counts[1]))
}

# Does not change the exit status of who ends, however much of it has ended before.
end_beside() {
  kill -- "-$beside_job" 2>/dev/null || true
  rm -rf "$beside_folder"
}

# give_verdict: how many passed and failed; the status is that of all.
give_verdict() {
  say "Took $(($(date +%s) - checks_began)) seconds; the checks:"
  echo "$passed passed, $failed failed"
  [ "$failed" -eq 0 ]
}
