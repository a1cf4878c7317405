# SPDX-License-Identifier: Apache-2.0
# What the toolchain files of the panels share. LOKA_PANEL_TRIPLET names the cross compiler.
set(CMAKE_SYSTEM_NAME Linux)
set(CMAKE_SYSTEM_PROCESSOR arm)
set(CMAKE_C_COMPILER ${LOKA_PANEL_TRIPLET}-gcc)
set(CMAKE_CXX_COMPILER ${LOKA_PANEL_TRIPLET}-g++)
# No notes about a calling convention that changed before version 7 of the compiler.
set(CMAKE_CXX_FLAGS_INIT -Wno-psabi)
# Tests may count with 64-bit atomics, which ARMv5 leaves to a library; libLOKA's check refuses it.
set(CMAKE_CXX_STANDARD_LIBRARIES_INIT "-Wl,--push-state,--as-needed -latomic -Wl,--pop-state")
set(CMAKE_LIBRARY_ARCHITECTURE ${LOKA_PANEL_TRIPLET})

# Libraries for the target that tests and the reference host use; scripts/panel.sh fills the folder.
# Nothing of the build machine may be found in their place.
set(CMAKE_FIND_ROOT_PATH ${CMAKE_BINARY_DIR}/target)
set(CMAKE_FIND_ROOT_PATH_MODE_PROGRAM NEVER)
set(CMAKE_FIND_ROOT_PATH_MODE_LIBRARY ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_INCLUDE ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_PACKAGE ONLY)

# Test programs are asked for their cases when the tests run: a build needs no emulator.
set(CMAKE_GTEST_DISCOVER_TESTS_DISCOVERY_MODE PRE_TEST)

# Programs for the target run under user-mode emulation.
set(CMAKE_CROSSCOMPILING_EMULATOR qemu-arm -L /usr/${LOKA_PANEL_TRIPLET} -E
                                  LD_LIBRARY_PATH=${CMAKE_BINARY_DIR}/target/usr/lib/${LOKA_PANEL_TRIPLET})
