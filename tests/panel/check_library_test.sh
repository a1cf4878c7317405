#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# Makes small libraries, each with one fault, and sees whether check-library.sh names the fault.
#
#   check_library_test.sh CHECK COMPILER

set -euo pipefail

check=$1
compiler=$2
folder=$(mktemp -d)
trap 'rm -rf "$folder"' EXIT
failures=0

# library NAME SOURCE FLAGS...: builds one.
library() {
  local name=$1 source=$2
  shift 2
  printf '%s\n' "$source" >"$folder/$name.cpp"
  "$compiler" -shared -fPIC -o "$folder/$name.so" "$folder/$name.cpp" -Wl,--hash-style=both "$@"
}

# expect NAME TEXT: the check says this text; an empty text stands for a library that passes.
expect() {
  local name=$1 text=$2 said status=0
  said=$("$check" "$folder/$name.so" 2>&1) || status=$?
  if [ -z "$text" ] && [ "$status" -eq 0 ]; then return; fi
  if [ -n "$text" ] && [ "$status" -ne 0 ] && printf '%s' "$said" | grep -qF "check-library: $text"; then
    return
  fi
  printf '%s: status %s, expected "%s", said:\n%s\n' "$name" "$status" "$text" "$said"
  failures=$((failures + 1))
}

export NEWEST_GLIBC=2.99 LARGEST_KIB=160
entry='#include <cstdlib>
extern "C" __attribute__((visibility("default"))) void* GetInterfaceFactory() { return malloc(1); }'

library good "$entry" -fvisibility=hidden
expect good ""
NEWEST_GLIBC=2.1 expect good "needs GLIBC_2.2.5, newer than GLIBC_2.1:"
LARGEST_KIB=1 expect good "the stripped file has "
library stray "$entry
void Stray() {}"
expect stray "exports Stray()"
library silent 'extern "C" void Other() {}' -fvisibility=hidden
expect silent "GetInterfaceFactory is not exported"
library needy "$entry" -fvisibility=hidden -Wl,--no-as-needed -lz
expect needy "needs the library libz.so.1"
library modern "$entry" -fvisibility=hidden -Wl,--hash-style=gnu
expect modern "no symbol table for loaders before 2.5"
library unique "$entry
template <class T> struct Holder { static int value; };
template <class T> int Holder<T>::value = 1;
template struct __attribute__((visibility(\"default\"))) Holder<int>;"
expect unique "old loaders refuse its OS/ABI"

echo "check_library_test: $failures failures"
[ "$failures" -eq 0 ]
