# SPDX-License-Identifier: Apache-2.0
# What the scripts share. Sourced, never run.

set -euo pipefail

project_dir=$(cd "$(dirname "${BASH_SOURCE[0]}")/.." && pwd)

# Packages of Debian 12 (or a relative of it) by purpose.
build_packages=(g++ cmake ninja-build pkg-config zlib1g-dev libsqlite3-dev libcli11-dev
  nlohmann-json3-dev libpugixml-dev libedit-dev libspdlog-dev scdoc)
test_packages=(libgtest-dev binutils procps tmux zsh fish python3-jsonschema)
check_packages=(clang clang-format clang-tidy libclang-rt-14-dev lld)

say() { printf '\n== %s\n' "$*"; }

die() {
  printf 'error: %s\n' "$*" >&2
  exit 1
}

# need_packages NAME...: installs those that are missing.
need_packages() {
  command -v apt-get >/dev/null ||
    die "no apt-get here; these scripts expect Debian 12 (or install these yourself: $*)"
  local missing=() package
  for package in "$@"; do
    dpkg-query -W -f='${Status}' "$package" 2>/dev/null | grep -q 'ok installed' ||
      missing+=("$package")
  done
  if [ ${#missing[@]} -eq 0 ]; then
    say "All needed packages are installed"
    return
  fi
  say "Installing ${missing[*]}"
  local as_root=()
  if [ "$(id -u)" -ne 0 ]; then
    command -v sudo >/dev/null || die "run as root once, or install: ${missing[*]}"
    as_root=(sudo)
  fi
  "${as_root[@]}" apt-get update -qq
  "${as_root[@]}" env DEBIAN_FRONTEND=noninteractive \
    apt-get install -y -qq --no-install-recommends "${missing[@]}" >/dev/null
}

# build PRESET [TARGET...]: configures and builds.
build() {
  local preset=$1 targets=() target
  shift
  for target in "$@"; do targets+=(--target "$target"); done
  say "Building, preset $preset"
  (
    cd "$project_dir"
    cmake --preset "$preset" >/dev/null
    cmake --build --preset "$preset" "${targets[@]}"
  )
}

# run_tests PRESET [CTEST-OPTION...]: runs the preset's tests.
run_tests() {
  local preset=$1
  shift
  say "Running the tests, preset $preset"
  (
    cd "$project_dir"
    ctest --preset "$preset" "$@"
  )
}
