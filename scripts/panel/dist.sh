# SPDX-License-Identifier: Apache-2.0
# scripts/panel.sh dist

. "$project_dir/scripts/panel/archive.sh"
. "$project_dir/scripts/panel/build.sh"
for abi in "${panel_abis[@]}"; do
  make_archive "$abi"
  say "$(archive_file "$abi")"
  tar -tzf "$(archive_file "$abi")" | grep -v '/$'
done
(cd "$project_dir/build/dist" && sha256sum -- *.tar.gz | tee SHA256SUMS)
say "panel.sh dist: one archive for each ABI stands in build/dist"
