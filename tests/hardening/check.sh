#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# check.sh program|library FILE: says which hardening an ELF file has; exit status 0 when it has all.

set -euo pipefail
export LC_ALL=C

kind=$1
file=$2
failed=0

# check NAME COMMAND...: one property.
check() {
  local name=$1
  shift
  if "$@"; then
    echo "ok      $name"
  else
    echo "MISSING $name"
    failed=1
  fi
}

headers=$(readelf -lW "$file")
dynamic=$(readelf -dW "$file")
# Names of functions that the file takes from others.
wanted=$(readelf --dyn-syms -W "$file" | awk '$7 == "UND" { sub(/@.*/, "", $8); print $8 }')

has_relro() { grep -q GNU_RELRO <<<"$headers"; }
binds_at_once() { grep -qE 'BIND_NOW|FLAGS_1.*\bNOW\b' <<<"$dynamic"; }
stack_is_not_run() { grep -E 'GNU_STACK' <<<"$headers" | grep -qE ' RW +0x' ; }
nothing_is_written_and_run() { ! grep -E '^ +LOAD' <<<"$headers" | grep -q 'RWE'; }
has_stack_protector() { grep -qx '__stack_chk_fail' <<<"$wanted"; }
is_fortified() { grep -qE '^__[a-z]+_chk$' <<<"$(grep -vx __stack_chk_fail <<<"$wanted")"; }
is_position_independent() { grep -q 'FLAGS_1.*\bPIE\b' <<<"$dynamic"; }
has_no_text_relocations() { ! grep -q TEXTREL <<<"$dynamic"; }

check "tables are read-only once it runs (RELRO)" has_relro
check "all symbols are bound at the start (BIND_NOW)" binds_at_once
check "the stack is not executable" stack_is_not_run
check "no memory is both written and executed" nothing_is_written_and_run
check "stack protector" has_stack_protector
check "no relocations in code" has_no_text_relocations
if [ "$kind" = program ]; then
  check "checked C library functions (_FORTIFY_SOURCE)" is_fortified
  check "position-independent program (PIE)" is_position_independent
fi
exit "$failed"
