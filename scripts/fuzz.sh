#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# Fuzzes the driver with the address and undefined behaviour sanitizers: scripts/fuzz.sh [SECONDS]
# [TARGET...]. Without arguments 60 seconds a target and all targets, as many at a time as there are
# processors (LOKA_FUZZ_JOBS says otherwise). An input that breaks something stands in
# fuzz/corpus/TARGET afterwards, where the ordinary tests replay it. What a run learns is kept in the
# build folder (LOKA_FUZZ_DIR, build/fuzz otherwise) for the next run.

. "$(dirname "$0")/lib.sh"

seconds=${1:-60}
[[ $seconds =~ ^[1-9][0-9]*$ ]] || die "the first argument is a number of seconds, not '$seconds'"
shift || true
targets=("$@")
[ ${#targets[@]} -gt 0 ] ||
  targets=(config tag_uri console receive conversion storage operations)
build_dir=${LOKA_FUZZ_DIR:-$project_dir/build/fuzz}
jobs=${LOKA_FUZZ_JOBS:-$(nproc)}

need_packages "${build_packages[@]}" "${test_packages[@]}" "${check_packages[@]}"
cd "$project_dir"
say "Building the fuzz targets"
cmake --preset fuzz -B "$build_dir" >/dev/null
ninja -C "$build_dir" "${targets[@]/#/fuzz_}" >/dev/null

# last_value FILE NAME: a figure of the engine's closing statistics.
last_value() { sed -n "s/^stat::$2: *//p" "$1" | tail -1; }

# fuzz TARGET: runs one target, prints a line of figures and what was found.
fuzz() {
  local target=$1 verdict=ok
  local learnt=$build_dir/learnt/$target log=$build_dir/learnt/$target.log
  mkdir -p "$learnt"
  nice -n 19 "$build_dir/fuzz_$target" -max_total_time="$seconds" -timeout=120 -max_len=1024 \
    -print_final_stats=1 -artifact_prefix="$project_dir/fuzz/corpus/$target/" \
    "$learnt" "$project_dir/fuzz/corpus/$target" >"$log" 2>&1 || verdict=FAILED
  printf '%-10s %s: %s inputs in %s s, %s edges covered, %s inputs learnt\n' "$target" "$verdict" \
    "$(last_value "$log" number_of_executed_units)" "$seconds" \
    "$(grep -ao 'cov: [0-9]*' "$log" | tail -1 | tr -dc 0-9)" "$(find "$learnt" -type f | wc -l)"
  [ "$verdict" = ok ] && return
  grep -aE '^fuzz:|SUMMARY|Test unit written' "$log" || tail -5 "$log"
  return 1
}

failed=0
running=0
for target in "${targets[@]}"; do
  if [ "$running" -ge "$jobs" ]; then
    wait -n || failed=$((failed + 1))
    running=$((running - 1))
  fi
  fuzz "$target" &
  running=$((running + 1))
done
for ((; running > 0; running--)); do wait -n || failed=$((failed + 1)); done

[ "$failed" -eq 0 ] || die "fuzz.sh: $failed of ${#targets[@]} targets failed (see above)"
say "fuzz.sh: ${#targets[@]} targets, $seconds seconds each, nothing found"
