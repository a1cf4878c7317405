# SPDX-License-Identifier: Apache-2.0
# Toolchain for panels with ARMv5TE without floating point hardware (Debian's armel).
set(LOKA_PANEL_TRIPLET arm-linux-gnueabi)
include(${CMAKE_CURRENT_LIST_DIR}/toolchain.cmake)
