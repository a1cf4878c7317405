#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# Runs clang-tidy over the driver and the host, several sources at a time: most of its time goes to the
# headers. Arguments are file names to check, one by one, instead of all.

. "$(dirname "$0")/lib.sh"

cd "$project_dir"
need_packages "${build_packages[@]}" clang clang-tidy
folder=build/tidy
if [ $# -gt 0 ]; then
  folder=build/tidy-single
  cmake --preset tidy -B "$folder" -DCMAKE_UNITY_BUILD=OFF >/dev/null
  files=("$@")
else
  cmake --preset tidy >/dev/null
  mapfile -t files < <(find "$folder" -path '*/Unity/unity_*' | sort)
  files+=(host/main.cpp)
fi
cmake --build "$folder" --target loka_description >/dev/null
[ ${#files[@]} -gt 1 ] || [ $# -gt 0 ] || die "no source files found"
say "Static analysis of ${#files[@]} sources or groups of them"
if printf '%s\n' "${files[@]}" | xargs -P "$(nproc)" -n 1 clang-tidy -p "$folder" --quiet; then
  say "check-tidy.sh: no finding"
else
  die "check-tidy.sh: clang-tidy has findings (see above)"
fi
