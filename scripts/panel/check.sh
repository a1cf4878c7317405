# SPDX-License-Identifier: Apache-2.0
# scripts/panel.sh check [ABI...]

abis=("$@")
[ ${#abis[@]} -gt 0 ] || abis=("${panel_abis[@]}")
programs=(loka_unit_tests plugin_tests slot_tests slot_table_tests symbol_tests
  arm_difference_tests)
# Left out here. User-mode emulation has no memory limit for the emulated program alone and cannot
# start itself a second time; both kinds run on the emulated panel, in a system of its own.
left_out=MemoryShortageTest.*:ModuleTest.FirstErrorTextIsEmpty
# Too slow here: one prefix of the exhaustive comparison stays, and the other megabytes.
left_out+=:HostileInputTest.AMegabyteOfNodes
for prefix in none x02 x03 x0203 x0302 x0303; do
  left_out+=:Prefixes/FramingTest.AgreesWithTheReferenceOnEveryShortLine/$prefix
done
need_packages "${panel_build_packages[@]}" googletest qemu-user

# run_program ABI PROGRAM: one test program under emulation, its last lines as verdict.
run_program() {
  local abi=$1 program=$2 triplet dir begun log
  triplet=$(panel_triplet "$abi")
  dir=$(panel_build_dir "$abi")
  log=$dir/$program.log
  begun=$(date +%s)
  if qemu-arm -L "/usr/$triplet" -E "LD_LIBRARY_PATH=$dir/target/usr/lib/$triplet" \
    "$dir/$program" --gtest_brief=1 --gtest_filter="-$left_out" >"$log" 2>&1; then
    printf '%-8s %-20s %s, %s s\n' "$abi" "$program" "$(grep -o 'PASSED.*' "$log" | tail -1)" \
      "$(($(date +%s) - begun))"
  else
    cat "$log"
    printf '%-8s %-20s FAILED, %s s\n' "$abi" "$program" "$(($(date +%s) - begun))"
    return 1
  fi
}

# run_programs ABI: all of them, one after the other; how many failed is the status.
run_programs() {
  local program failures=0
  for program in "${programs[@]}"; do
    run_program "$1" "$program" || failures=$((failures + 1))
  done
  return "$failures"
}

for abi in "${abis[@]}"; do
  target_libraries "$abi" zlib1g zlib1g-dev libpugixml1v5 libpugixml-dev
  target_googletest "$abi"
  say "Building the tests for $abi"
  cmake -S "$project_dir" --preset "panel-$abi" -DLOKA_BUILD_TESTS=ON >/dev/null
  cmake --build "$(panel_build_dir "$abi")" --target LOKA "${programs[@]}"
done
say "Running the tests under user-mode emulation, the ABIs side by side"
jobs=()
for abi in "${abis[@]}"; do
  run_programs "$abi" &
  jobs+=($!)
done
failures=0
for job in "${jobs[@]}"; do
  wait "$job" || failures=$((failures + $?))
done
[ "$failures" -eq 0 ] || die "panel.sh check: $failures test programs failed (see above)"
say "panel.sh check: all tests passed"
