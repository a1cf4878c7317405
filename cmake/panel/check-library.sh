#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# Checks a library for a panel, prints its figures and writes the stripped file beside it, FILE.stripped.
#
#   check-library.sh FILE
#
# Fails when a newer symbol version of the C library is needed, another library is needed, another
# symbol is exported, the stripped file is too large or an old loader cannot read it.
# NM, READELF and STRIP name the tools for the target; NEWEST_GLIBC and LARGEST_KIB change the limits.

set -euo pipefail
export LC_ALL=C

file=$1
newest=${NEWEST_GLIBC:-2.4}
largest_kib=${LARGEST_KIB:-160}
nm=${NM:-nm}
readelf=${READELF:-readelf}
strip=${STRIP:-strip}
failures=0

fail() {
  printf 'check-library: %s\n' "$*" >&2
  failures=$((failures + 1))
}

# Those of the version numbers on stdin that are newer than $1.
newer_than() { (echo "$1" && cat) | sort -uV | awk -v limit="$1" 'seen { print } $0 == limit { seen = 1 }'; }

stripped=$file.stripped
"$strip" --strip-unneeded -o "$stripped" "$file"

versions=$("$readelf" -V --wide "$stripped" | grep -o 'Name: [A-Z]*_[0-9.]*' | cut -d' ' -f2 | sort -uV ||
  true)
[ -n "$versions" ] || fail "no symbol version found, the file was not read"
strange=$(printf '%s\n' "$versions" | grep -v '^GLIBC_' || true)
[ -z "$strange" ] || fail "needs versions of other libraries:" $strange
numbers=$(printf '%s\n' "$versions" | sed -n 's/^GLIBC_//p')
for version in $(printf '%s\n' "$numbers" | newer_than "$newest"); do
  fail "needs GLIBC_$version, newer than GLIBC_$newest:" \
    $("$nm" -D --undefined-only "$stripped" | sed -n "s/^ *[A-Za-z] \\(.*@GLIBC_$version\\)\$/\\1/p")
done

libraries=$("$readelf" -d "$stripped" | sed -n 's/.*(NEEDED).*\[\(.*\)\].*/\1/p')
for library in $libraries; do
  case $library in
    # The C library's own three parts.
    libc.so.6 | libm.so.6 | ld-linux*.so.*) ;;
    *) fail "needs the library $library" ;;
  esac
done

exports=$("$nm" -D -C --defined-only "$stripped" | sed 's/^[0-9a-f]* [A-Za-z] //')
printf '%s\n' "$exports" | grep -qx 'GetInterfaceFactory' || fail "GetInterfaceFactory is not exported"
extra=$(printf '%s\n' "$exports" | grep -vE '^(GetInterfaceFactory|ProtUtilsN::.*)$' || true)
if [ -n "$extra" ]; then
  while IFS= read -r line; do fail "exports $line"; done <<<"$extra"
fi

size=$(stat -c %s "$stripped")
[ "$size" -le $((largest_kib * 1024)) ] ||
  fail "the stripped file has $size bytes, more than $largest_kib KiB"

"$readelf" -d "$stripped" | grep -q '(HASH)' || fail "no symbol table for loaders before 2.5"
"$readelf" -h "$stripped" | grep -q 'OS/ABI:.*System V' || fail "old loaders refuse its OS/ABI"
if "$readelf" -d "$stripped" | grep -q TEXTREL; then fail "has relocations in its code"; fi

if [ "$failures" -gt 0 ]; then
  rm -f "$stripped"
  exit 1
fi
printf 'size of the stripped library  %s bytes (at most %s KiB)\n' "$size" "$largest_kib"
printf 'symbol versions needed        %s\n' "$(printf '%s ' $versions)"
printf 'libraries needed              %s\n' "$(printf '%s ' $libraries)"
printf 'symbols exported              %s (GetInterfaceFactory and ProtUtilsN)\n' \
  "$(printf '%s\n' "$exports" | wc -l)"
