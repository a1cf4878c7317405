# SPDX-License-Identifier: Apache-2.0
# Toolchain for panels with ARMv7-A with hardware floating point (Debian's armhf).
set(LOKA_PANEL_TRIPLET arm-linux-gnueabihf)
include(${CMAKE_CURRENT_LIST_DIR}/toolchain.cmake)
