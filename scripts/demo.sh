#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# From a fresh checkout to the driver's main job: installs what is missing, builds the plug-in and the
# reference host, and plays the typical exchange with a simulated device on a pseudo-terminal.
# Exit status 0 when every step went as expected.

. "$(dirname "$0")/lib.sh"

need_packages "${build_packages[@]}"
build release LOKA loka
say "Running the demonstration: build/release/loka demo"
if "$project_dir/build/release/loka" demo; then
  say "demo.sh: all is well"
else
  say "demo.sh: the demonstration failed (see above)"
  exit 1
fi
