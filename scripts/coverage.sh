#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# Line and branch coverage of the driver's folders by the driver's ordinary tests: builds with
# counters, runs the tests, lists what no test reaches, and fails below 99 % of the lines or 95 % of
# the branches. LOKA_COVERAGE_DIR names the build folder (build/coverage otherwise).
#
# Branches that only the compiler sees (the ways out of every call by an exception) are not counted;
# that exceptions stay inside is what failure_tests is for.

. "$(dirname "$0")/lib.sh"

lines_percent=99
branches_percent=95
build_dir=${LOKA_COVERAGE_DIR:-$project_dir/build/coverage}
programs=(loka_unit_tests plugin_tests failure_tests slot_tests document_tests)
fuzz_targets=(config tag_uri console receive conversion storage operations)

need_packages "${build_packages[@]}" "${test_packages[@]}" gcovr
cd "$project_dir"
say "Building with counters"
cmake --preset coverage -B "$build_dir" -DLOKA_BUILD_HOST=OFF >/dev/null
ninja -C "$build_dir" "${programs[@]}" "${fuzz_targets[@]/#/fuzz_}" >/dev/null

say "Running the driver's tests"
find "$build_dir" -name '*.gcda' -delete
for program in "${programs[@]}"; do
  "$build_dir/$program" --gtest_brief=1 >"$build_dir/$program.log" 2>&1 ||
    die "$program fails, see $build_dir/$program.log"
done
for target in "${fuzz_targets[@]}"; do
  "$build_dir/fuzz_$target" "fuzz/corpus/$target" >"$build_dir/fuzz_$target.log" 2>&1 ||
    die "fuzz_$target fails, see $build_dir/fuzz_$target.log"
done

# report OPTION...: a report about the driver's folders.
report() {
  gcovr --root . --object-directory "$build_dir" --exclude-throw-branches \
    --exclude-unreachable-branches --filter '(interfaces|protlib|model|driver|factory)/' "$@" \
    "${folders[@]}"
}
folders=("$build_dir/protlib" "$build_dir/model" "$build_dir/driver" "$build_dir/factory"
  "$build_dir/tests/unit")

say "Lines and branches of the driver's folders"
report --txt "$build_dir/lines.txt" --json-summary "$build_dir/coverage.json"
report --branches --txt "$build_dir/branches.txt"
cat "$build_dir/lines.txt" "$build_dir/branches.txt"
report --fail-under-line "$lines_percent" --fail-under-branch "$branches_percent" \
  --print-summary --txt "$build_dir/summary.txt" || die "coverage.sh: below $lines_percent % of the lines or $branches_percent % of the branches"
say "coverage.sh: at least $lines_percent % of the lines and $branches_percent % of the branches"
