# SPDX-License-Identifier: Apache-2.0
# What the panel's commands share. Sourced by scripts/panel.sh, behind scripts/lib.sh.

panel_abis=(armhf armel)
panel_build_packages=(g++ cmake ninja-build zlib1g-dev g++-arm-linux-gnueabihf
  g++-arm-linux-gnueabi binutils)

# panel_triplet ABI: the prefix of the cross compiler's tools.
panel_triplet() {
  case $1 in
    armhf) echo arm-linux-gnueabihf ;;
    armel) echo arm-linux-gnueabi ;;
    *) die "no such ABI: $1" ;;
  esac
}

panel_build_dir() { echo "$project_dir/build/panel-$1"; }

# panel_figures ABI: checks the built library and prints its figures.
panel_figures() {
  local triplet
  triplet=$(panel_triplet "$1")
  NM=$triplet-nm READELF=$triplet-readelf STRIP=$triplet-strip \
    "$project_dir/cmake/panel/check-library.sh" "$(panel_build_dir "$1")/libLOKA.so"
}
