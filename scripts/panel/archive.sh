# SPDX-License-Identifier: Apache-2.0
# The archives for panel makers. Sourced by scripts/panel/dist.sh and scripts/panel/test.sh.

archive_version() {
  sed -n 's/^project(LOKA VERSION \([0-9.]*\).*/\1/p' "$project_dir/CMakeLists.txt"
}

archive_name() { echo "libLOKA-$(archive_version)-$1"; }
archive_file() { echo "$project_dir/build/dist/$(archive_name "$1").tar.gz"; }

# archive_date: of the last change; a source tree without history has that of its main file.
archive_date() {
  git -C "$project_dir" log -1 --format=%cI 2>/dev/null || date -r "$project_dir/CMakeLists.txt" -Is
}

# make_archive ABI: from the built library.
make_archive() {
  local abi=$1 folder
  panel_figures "$abi" >/dev/null
  folder=$project_dir/build/dist/$(archive_name "$abi")
  rm -rf "$folder"
  mkdir -p "$folder/interfaces" "$folder/examples"
  cp "$(panel_build_dir "$abi")/libLOKA.so.stripped" "$folder/libLOKA.so"
  cp "$project_dir"/interfaces/*.h "$folder/interfaces/"
  cp "$project_dir/driver/Xml_LOKA.xml" "$folder/LOKA.xml"
  cp "$project_dir/examples/minimal_host/MinimalHost.cpp" "$folder/examples/"
  cp "$project_dir/docs/panel-integration.md" "$project_dir/docs/threads.md" "$folder/"
  cp "$project_dir/LICENSE" "$folder/"
  (cd "$folder" && find . -type f ! -name SHA256SUMS -printf '%P\n' | sort |
    xargs sha256sum >SHA256SUMS)
  # The same sources give the same archive.
  tar -C "$project_dir/build/dist" --sort=name --owner=0 --group=0 --numeric-owner \
    --mtime="$(archive_date)" -cf - "$(archive_name "$abi")" |
    gzip -9n >"$(archive_file "$abi")"
}
