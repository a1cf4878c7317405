#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# The library as it ships in a panel. Installs what is missing, says what it does, ends with a verdict
# and an exit status.

. "$(dirname "$0")/lib.sh"
. "$(dirname "$0")/panel/common.sh"

usage() {
  cat <<'TEXT'
usage: scripts/panel.sh COMMAND

  build   cross-builds libLOKA.so for armhf and armel, checks both and prints their figures
  check [ABI...]
          runs the unit and plug-in tests for both under user-mode emulation
  test [GTEST-OPTION...]
          runs library and reference host in an emulated panel, with a device at its serial line
  dist    makes an archive for each ABI: library, description, headers, guide, checksums, licence
  help    prints this text
TEXT
}

case "${1:-}" in
  build | check | test | dist)
    command=$1
    shift
    . "$(dirname "$0")/panel/$command.sh"
    ;;
  help | --help | -h) usage ;;
  *)
    usage >&2
    exit 2
    ;;
esac
