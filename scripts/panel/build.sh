# SPDX-License-Identifier: Apache-2.0
# scripts/panel.sh build

need_packages "${panel_build_packages[@]}"
for abi in "${panel_abis[@]}"; do
  build "panel-$abi" LOKA
done
for abi in "${panel_abis[@]}"; do
  say "The library for $abi: $(panel_build_dir "$abi")/libLOKA.so"
  panel_figures "$abi"
done
say "panel.sh build: both libraries are as they must be"
