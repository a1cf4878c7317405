#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# Checks that every source file is formatted as .clang-format says. With --fix, formats them.

. "$(dirname "$0")/lib.sh"

mode=(--dry-run -Werror)
[ "${1:-}" = "--fix" ] && mode=(-i)
cd "$project_dir"
mapfile -t files < <(git ls-files '*.h' '*.cpp')
[ ${#files[@]} -gt 0 ] || die "no source files found"
clang-format "${mode[@]}" "${files[@]}"
say "check-format.sh: ${#files[@]} files are well formatted"
