#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# Measures the driver and the reference host beside what people use instead: installs what is
# missing, builds, runs every reader in turn and prints one table a question.
#
#   scripts/bench.sh           everything, less than 30 minutes; writes docs/benchmarks.md and its
#                              drawings in docs/benchmarks/
#   scripts/bench.sh --quick   every part once and briefly, less than 3 minutes; shows that all of it
#                              works and judges no figure
#
# Other options go to bench/measure.py (--help lists them). LOKA_BENCH_BUILD names another build
# folder than build/release.

. "$(dirname "$0")/lib.sh"

bench_packages=(libboost-dev libgensio-dev libserialport-dev libbenchmark-dev python3
  python3-serial valgrind)
build_dir=${LOKA_BENCH_BUILD:-$project_dir/build/release}
node_dir=$build_dir/node

need_packages "${build_packages[@]}" "${bench_packages[@]}"
command -v node >/dev/null || need_packages nodejs
command -v npm >/dev/null || need_packages npm

say "Building into $build_dir"
(
  cd "$project_dir"
  cmake --preset release -B "$build_dir" -DLOKA_BUILD_BENCH=ON >/dev/null
)
cmake --build "$build_dir" --target bench_programs
if [ ! -d "$node_dir/node_modules/serialport" ]; then
  say "Fetching node-serialport into $node_dir"
  mkdir -p "$node_dir"
  (cd "$node_dir" && npm install --no-audit --no-fund --loglevel=error serialport)
fi

more=("$@")
if [ $# -eq 0 ]; then
  more=(--page "$project_dir/docs/benchmarks.md" --json "$build_dir/benchmarks.json")
fi

say "Measuring"
LOKA_BENCH_NODE=$node_dir python3 "$project_dir/bench/measure.py" --build "$build_dir" "${more[@]}"
say "bench.sh: done"
