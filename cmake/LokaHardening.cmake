# SPDX-License-Identifier: Apache-2.0
# What makes a fault in shipped code end the program instead of being used by somebody: read-only
# tables, no executable stack, a guarded stack, checked calls of the C library, addresses that differ
# from run to run. For optimised builds without sanitizers; tests/hardening reads the result.

set(LOKA_HARDENED OFF)
if(CMAKE_BUILD_TYPE MATCHES "^(Release|RelWithDebInfo)$" AND NOT LOKA_SANITIZE AND NOT LOKA_PANEL_LIBRARY)
  set(LOKA_HARDENED ON)
  include(CheckPIESupported)
  check_pie_supported(LANGUAGES CXX)
  target_compile_options(loka_compile INTERFACE -fstack-protector-strong -fstack-clash-protection
                                                -U_FORTIFY_SOURCE -D_FORTIFY_SOURCE=2)
  target_link_options(loka_compile INTERFACE LINKER:-z,relro LINKER:-z,now LINKER:-z,noexecstack)
endif()
