# SPDX-License-Identifier: Apache-2.0
# How everything in this project is compiled: language, warnings, visibility, sanitizers.

set(CMAKE_CXX_STANDARD 17)
set(CMAKE_CXX_STANDARD_REQUIRED ON)
set(CMAKE_CXX_EXTENSIONS OFF)
set(CMAKE_POSITION_INDEPENDENT_CODE ON)
set(CMAKE_CXX_VISIBILITY_PRESET hidden)
set(CMAKE_VISIBILITY_INLINES_HIDDEN ON)
set(CMAKE_EXPORT_COMPILE_COMMANDS ON)

find_package(Threads REQUIRED)

# Interface target that every target of ours links.
add_library(loka_compile INTERFACE)
target_include_directories(loka_compile INTERFACE ${PROJECT_SOURCE_DIR})
# The exported utility functions carry std::string, so its layout is part of the binary interface.
target_compile_definitions(loka_compile INTERFACE _GLIBCXX_USE_CXX11_ABI=1)
target_compile_options(
  loka_compile
  INTERFACE -Wall
            -Wextra
            -Wpedantic
            -Wshadow
            -Wconversion
            -Wsign-conversion
            -Wcast-align
            -Wcast-qual
            -Wold-style-cast
            -Wnon-virtual-dtor
            -Woverloaded-virtual
            -Wformat=2
            -Wundef
            $<$<BOOL:${LOKA_WARNINGS_AS_ERRORS}>:-Werror>
            $<$<CXX_COMPILER_ID:Clang>:-Wthread-safety>)
# Nobody else's functions stand in for the exported ones; the library is linked that way too.
target_compile_options(loka_compile
                       INTERFACE $<$<CXX_COMPILER_ID:GNU>:-fno-semantic-interposition>)
target_link_libraries(loka_compile INTERFACE Threads::Threads)

if(LOKA_SANITIZE)
  target_compile_options(loka_compile INTERFACE -fsanitize=${LOKA_SANITIZE} -fno-omit-frame-pointer
                                                -fno-sanitize-recover=all)
  target_link_options(loka_compile INTERFACE -fsanitize=${LOKA_SANITIZE})
endif()

# loka_objects(<folder> <sources...> [DEPENDS <folders...>]): one object library for a folder.
function(loka_objects folder)
  cmake_parse_arguments(ARG "" "" "DEPENDS" ${ARGN})
  add_library(loka_${folder} OBJECT ${ARG_UNPARSED_ARGUMENTS})
  target_link_libraries(loka_${folder} PUBLIC loka_compile)
  foreach(lower IN LISTS ARG_DEPENDS)
    target_link_libraries(loka_${folder} PUBLIC loka_${lower})
  endforeach()
endfunction()
