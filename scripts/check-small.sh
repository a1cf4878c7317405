#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# Builds the smallest loka (loader, port, command line, NDJSON) with none of the optional packages to
# be found, and sees that it needs no library of theirs and still reads tokens.

. "$(dirname "$0")/lib.sh"

need_packages g++ cmake ninja-build zlib1g-dev libcli11-dev nlohmann-json3-dev binutils
folder=$project_dir/build/small

say "Building the smallest loka"
without=(-DLOKA_BUILD_TESTS=OFF -DCMAKE_UNITY_BUILD=ON -DCMAKE_UNITY_BUILD_BATCH_SIZE=10)
for part in STORE DESCRIPTION TERM LOG; do without+=("-DLOKA_WITH_$part=OFF"); done
for package in SQLite3 pugixml PkgConfig spdlog GTest; do
  without+=("-DCMAKE_DISABLE_FIND_PACKAGE_$package=ON")
done
cmake -S "$project_dir" -B "$folder" -G Ninja -DCMAKE_BUILD_TYPE=Debug "${without[@]}" >/dev/null
cmake --build "$folder" --target loka LOKA

say "What it needs"
needed=$(readelf -d "$folder/loka" | sed -n 's/.*(NEEDED).*\[\(.*\)\]/\1/p')
echo "$needed"
# The C and C++ run time and nothing else.
if grep -vE '^(libc|libm|libstdc\+\+|libgcc_s|ld-linux.*)\.so' <<<"$needed"; then
  die "the smallest loka needs more than the run time of its language"
fi

say "What it does"
scratch=$(mktemp -d)
"$folder/loka" sim scale --every 50 --link "$scratch/scale" >/dev/null &
device=$!
trap 'kill "$device" || true; rm -rf "$scratch"' EXIT
for _ in $(seq 100); do [ -e "$scratch/scale" ] && break || sleep 0.05; done
token=$("$folder/loka" sub "$scratch/scale" --rx-prefix STX --rx-suffix ETX -j -q -C 1 -W 20)
echo "$token"
grep -q '"ev":"token".*"text":"ST,GS+  5.12kg"' <<<"$token" || die "no token from the simulated scale"
for command in "describe" "store ls" "config check 'CfgVer=1'"; do
  echo "loka $command: $(eval "\"$folder/loka\" $command" 2>&1 | head -1)"
done
say "The smallest loka works"
