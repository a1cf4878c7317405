#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# Plays a device with noise, cut suffixes, over-long tokens, pulled plugs and changed settings to a
# running loka and accounts for every byte: scripts/soak.sh [SECONDS], 600 without an argument.
# LOKA_SOAK_DIR names a build folder to take instead of building the preset release. Exit status 0 when
# all is accounted for and memory and descriptors have stayed as they were.

. "$(dirname "$0")/lib.sh"

seconds=${1:-600}
[[ $seconds =~ ^[1-9][0-9]*$ ]] || die "the argument is a number of seconds, not '$seconds'"
build_dir=${LOKA_SOAK_DIR:-}
if [ -z "$build_dir" ]; then
  need_packages "${build_packages[@]}" python3
  build release LOKA loka
  build_dir=$project_dir/build/release
fi
say "Playing for $seconds seconds"
exec python3 "$project_dir/tests/soak/soak.py" "$build_dir/loka" "$build_dir/libLOKA.so" "$seconds"
