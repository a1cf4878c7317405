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
  --target LOKA loka plugin_tests arm_difference_tests minimal_host line_settings
build release emulated_panel_tests

# The library under test is the one that ships.
make_archive armhf
rm -rf "$panel_image/archive"
mkdir -p "$panel_image/archive"
tar -xzf "$(archive_file armhf)" -C "$panel_image/archive" --strip-components=1
(cd "$panel_image/archive" && sha256sum --quiet -c SHA256SUMS)
build_dir=$(panel_build_dir armhf)
make_image "$panel_image/archive/libLOKA.so" "$build_dir"/{loka,plugin_tests,arm_difference_tests} \
  "$build_dir"/{minimal_host,line_settings}
rm -f "$panel_image/disk"
truncate -s 16M "$panel_image/disk"
/sbin/mkfs.ext4 -q "$panel_image/disk"
say "Switching the panel on (set-up took $(($(date +%s) - begun)) s)"
begun=$(date +%s)
if LOKA_PANEL_IMAGE=$panel_image "$project_dir/build/release/emulated_panel_tests" "$@"; then
  say "panel.sh test: all is well on the emulated panel, after $(($(date +%s) - begun)) s"
else
  die "panel.sh test: failed after $(($(date +%s) - begun)) s (see above)"
fi
