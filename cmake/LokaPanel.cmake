# SPDX-License-Identifier: Apache-2.0
# The library as it ships in a panel: it carries its C++ runtime, needs the C library only, an old one
# too, and is small. Each build of it is checked; what does not hold fails the build.

option(LOKA_PANEL_LIBRARY "Build libLOKA as it ships in a panel" OFF)

if(LOKA_PANEL_LIBRARY)
  # Every function in a section of its own, so that the linker can leave out what nobody calls.
  target_compile_options(loka_compile INTERFACE -ffunction-sections -fdata-sections)
endif()

# loka_panel_library(<target>): makes the library one for a panel when LOKA_PANEL_LIBRARY is on.
function(loka_panel_library target)
  if(NOT LOKA_PANEL_LIBRARY)
    return()
  endif()
  target_sources(${target} PRIVATE ${PROJECT_SOURCE_DIR}/cmake/panel/OldCLibrary.cpp)
  target_link_libraries(${target} PRIVATE loka_compile)
  target_link_options(
    ${target}
    PRIVATE
    -static-libstdc++
    -static-libgcc
    -Wl,--gc-sections
    # Loaders older than 2006 know the older of the two symbol tables only.
    -Wl,--hash-style=both
    -Wl,-z,relro
    -Wl,-z,noexecstack)
  set(check ${PROJECT_SOURCE_DIR}/cmake/panel/check-library.sh)
  add_custom_command(
    TARGET ${target}
    POST_BUILD
    COMMAND ${CMAKE_COMMAND} -E env NM=${CMAKE_NM} READELF=${CMAKE_READELF} STRIP=${CMAKE_STRIP}
            ${check} $<TARGET_FILE:${target}>
    VERBATIM)
  set_property(TARGET ${target} APPEND PROPERTY LINK_DEPENDS ${check})
endfunction()
