# SPDX-License-Identifier: Apache-2.0
# Manual pages and completion files, which the program writes itself, and where everything goes.
include(GNUInstallDirs)

# The program looks for the driver there, as seen from its own folder.
install(TARGETS LOKA LIBRARY DESTINATION lib/loka/plugins)
install(TARGETS loka RUNTIME DESTINATION ${CMAKE_INSTALL_BINDIR})

# loka_written(<file> <command words...>): what the program prints, in a file of the build folder.
function(loka_written file)
  add_custom_command(
    OUTPUT ${file}
    COMMAND loka ${ARGN} > ${file}.new
    COMMAND ${CMAKE_COMMAND} -E rename ${file}.new ${file}
    DEPENDS loka
    VERBATIM)
endfunction()

set(completions ${PROJECT_BINARY_DIR}/completions)
file(MAKE_DIRECTORY ${completions} ${PROJECT_BINARY_DIR}/man)
loka_written(${completions}/loka completion bash)
loka_written(${completions}/_loka completion zsh)
loka_written(${completions}/loka.fish completion fish)
add_custom_target(completions ALL DEPENDS ${completions}/loka ${completions}/_loka
                                          ${completions}/loka.fish)
install(FILES ${completions}/loka DESTINATION ${CMAKE_INSTALL_DATADIR}/bash-completion/completions)
install(FILES ${completions}/_loka DESTINATION ${CMAKE_INSTALL_DATADIR}/zsh/vendor-completions)
install(FILES ${completions}/loka.fish DESTINATION ${CMAKE_INSTALL_DATADIR}/fish/vendor_completions.d)

find_program(LOKA_SCDOC scdoc DOC "Makes the manual pages")
if(LOKA_SCDOC)
  foreach(page IN ITEMS loka.1 loka-config.5)
    set(source ${PROJECT_SOURCE_DIR}/docs/man/${page}.scd)
    set(made ${PROJECT_BINARY_DIR}/man/${page})
    add_custom_command(
      OUTPUT ${made}
      COMMAND loka manual-page ${source} > ${made}.scd
      COMMAND ${LOKA_SCDOC} < ${made}.scd > ${made}.new
      COMMAND ${CMAKE_COMMAND} -E rename ${made}.new ${made}
      DEPENDS loka ${source}
      VERBATIM)
    list(APPEND pages ${made})
    string(REGEX MATCH "[0-9]$" section ${page})
    install(FILES ${made} DESTINATION ${CMAKE_INSTALL_MANDIR}/man${section})
  endforeach()
  add_custom_target(manual ALL DEPENDS ${pages})
else()
  message(STATUS "No manual pages: scdoc is not installed")
endif()
