# SPDX-License-Identifier: Apache-2.0
# scripts/panel.sh test [GTEST-OPTION...]

. "$project_dir/scripts/panel/image.sh"
. "$project_dir/scripts/panel/archive.sh"

need_packages "${panel_build_packages[@]}" "${build_packages[@]}" libgtest-dev googletest \
  qemu-system-arm e2fsprogs cpio kmod
begun=$(date +%s)
target_libraries armhf "${panel_host_packages[@]}"
target_googletest armhf
say "Building the library, the reference host and the tests for the panel"
cmake -S "$project_dir" --preset panel-armhf -DLOKA_BUILD_TESTS=ON -DLOKA_BUILD_HOST=ON \
  "${panel_host_options[@]}" >/dev/null
cmake --build "$(panel_build_dir armhf)" \
  --target LOKA loka plugin_tests arm_difference_tests line_settings
build panel-armel LOKA
build release emulated_panel_tests

# What is under test is what ships: the libraries, and the minimal host made of the archive's sources.
rm -rf "$panel_image/archive"
for abi in "${panel_abis[@]}"; do
  make_archive "$abi"
  mkdir -p "$panel_image/archive/$abi"
  tar -xzf "$(archive_file "$abi")" -C "$panel_image/archive/$abi" --strip-components=1
  (cd "$panel_image/archive/$abi" && sha256sum --quiet -c SHA256SUMS)
  "$(panel_triplet "$abi")-g++" -std=c++17 -O2 -Wall -Wextra -Wno-psabi -pthread \
    -I "$panel_image/archive/$abi" -o "$panel_image/archive/$abi/minimal_host" \
    "$panel_image/archive/$abi/examples/MinimalHost.cpp"
done
make_image

# run_panel DISK GTEST-OPTION...: switches a panel with a disk of its own on.
run_panel() {
  local disk=$panel_image/$1
  shift
  rm -f "$disk"
  truncate -s 16M "$disk"
  /sbin/mkfs.ext4 -q "$disk"
  LOKA_PANEL_IMAGE=$panel_image LOKA_PANEL_DISK=$disk \
    "$project_dir/build/release/emulated_panel_tests" "$@"
}

say "Switching the panel on (set-up took $(($(date +%s) - begun)) s)"
begun=$(date +%s)
failures=0
if [ $# -gt 0 ]; then
  run_panel disk "$@" || failures=1
else
  # Two panels side by side: streams and figures on one, everything else on the other.
  streams='*Stream*:*Silence*:FiguresTest.*'
  run_panel disk-of-streams --gtest_filter="$streams" >"$panel_image/streams.log" 2>&1 &
  streams_job=$!
  run_panel disk --gtest_filter="-$streams" || failures=1
  wait "$streams_job" || failures=1
  cat "$panel_image/streams.log"
fi
[ "$failures" -eq 0 ] || die "panel.sh test: failed after $(($(date +%s) - begun)) s (see above)"
say "panel.sh test: all is well on the emulated panel, after $(($(date +%s) - begun)) s"
