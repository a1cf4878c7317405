#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# From a fresh checkout to a verdict: installs what is missing, builds everything and runs all tests.
# Exit status 0 when every test passed. Options are handed to ctest, as in: scripts/test.sh -R Receive

. "$(dirname "$0")/lib.sh"

need_packages "${build_packages[@]}" "${test_packages[@]}"
build release
if run_tests release "$@"; then
  say "test.sh: all tests passed"
else
  say "test.sh: some tests failed (see above)"
  exit 1
fi
