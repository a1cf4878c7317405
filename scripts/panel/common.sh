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

# packages_for ARCHITECTURE PACKAGE...: downloads packages of another architecture, which this machine
# cannot install, into build/panel-packages/ARCHITECTURE. apt works on lists of its own there: the
# machine's own architectures and lists stay as they are.
packages_for() {
  local architecture=$1 folder=$project_dir/build/panel-packages/$1 missing=() package
  shift
  mkdir -p "$folder/lists/partial" "$folder/cache/archives/partial"
  for package in "$@"; do
    compgen -G "$folder/${package}_*.deb" >/dev/null || missing+=("$package")
  done
  [ ${#missing[@]} -gt 0 ] || return 0
  say "Downloading for $architecture: ${missing[*]}"
  local options=(-qq -o "APT::Architecture=$architecture" -o "APT::Architectures=$architecture"
    -o "Dir::State::Lists=$folder/lists" -o "Dir::Cache=$folder/cache"
    -o Dir::State::status=/dev/null -o APT::Sandbox::User=)
  # A list that one mirror cannot deliver just now need not be the one that is needed.
  compgen -G "$folder/lists/*Packages*" >/dev/null || apt-get "${options[@]}" update ||
    say "Not all package lists could be read; going on with the others"
  (cd "$folder" && apt-get "${options[@]}" download "${missing[@]}") ||
    die "cannot download for $architecture: ${missing[*]}"
}

# unpack_packages ARCHITECTURE FOLDER PACKAGE...: the files of downloaded packages, in a folder.
unpack_packages() {
  local architecture=$1 folder=$2 package
  shift 2
  mkdir -p "$folder"
  for package in "$@"; do
    dpkg-deb -x "$project_dir/build/panel-packages/$architecture/${package}"_*.deb "$folder"
  done
}

# target_libraries ABI PACKAGE...: libraries for the target where the toolchain file looks for them.
target_libraries() {
  local abi=$1 target stamp
  shift
  target=$(panel_build_dir "$abi")/target
  stamp=$target/packages-$(printf '%s-' "$@" | cksum | cut -d' ' -f1)
  [ -f "$stamp" ] && return
  packages_for "$abi" "$@"
  unpack_packages "$abi" "$target" "$@"
  touch "$stamp"
}

# target_googletest ABI: GoogleTest for the target, built from Debian's sources.
target_googletest() {
  local abi=$1 target work
  target=$(panel_build_dir "$abi")/target
  work=$(panel_build_dir "$abi")/googletest
  [ -f "$target/usr/lib/libgtest.a" ] && return
  say "Building GoogleTest for $abi"
  cmake -S /usr/src/googletest -B "$work" -G Ninja -DBUILD_GMOCK=OFF -DCMAKE_BUILD_TYPE=MinSizeRel \
    -DCMAKE_TOOLCHAIN_FILE="$project_dir/cmake/panel/$abi.cmake" -DCMAKE_INSTALL_PREFIX=/usr \
    -DCMAKE_INSTALL_LIBDIR=lib >/dev/null
  cmake --build "$work" >/dev/null
  DESTDIR=$target cmake --install "$work" >/dev/null
}

# What the reference host is built with, for the target.
panel_host_packages=(zlib1g zlib1g-dev libsqlite3-0 libsqlite3-dev libpugixml1v5 libpugixml-dev
  libcli11-dev nlohmann-json3-dev)
# Without the parts of it that need packages of their own and have nothing to do with a panel.
panel_host_options=(-DLOKA_WITH_TERM=OFF -DLOKA_WITH_LOG=OFF -DLOKA_WITH_WEB=OFF
  -DLOKA_WITH_MQTT=OFF --no-warn-unused-cli)
