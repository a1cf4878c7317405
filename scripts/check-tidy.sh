#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# Runs clang-tidy over the driver and the host with the flags of the asan build (clang, which also
# checks the thread-safety annotations). Arguments are file names to check instead of all.

. "$(dirname "$0")/lib.sh"

cd "$project_dir"
[ -f build/asan/compile_commands.json ] || cmake --preset asan >/dev/null
cmake --build --preset asan --target loka_description >/dev/null
if [ $# -gt 0 ]; then
  files=("$@")
else
  mapfile -t files < <(git ls-files 'protlib/*.cpp' 'model/*.cpp' 'driver/*.cpp' 'factory/*.cpp' 'host/*.cpp')
fi
[ ${#files[@]} -gt 0 ] || die "no source files found"
if printf '%s\n' "${files[@]}" | xargs -P "$(nproc)" -n 4 clang-tidy -p build/asan --quiet; then
  say "check-tidy.sh: no finding in ${#files[@]} files"
else
  die "check-tidy.sh: clang-tidy has findings (see above)"
fi
