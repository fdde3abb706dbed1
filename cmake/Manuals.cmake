# vexa_manual(TARGET): a program's manual page and completions, made from its own command line, and their installation.
# Sanitized programs are left out: not every system runs them just so.
option(VEXA_BUILD_MANUALS "Make manual pages and completions of the programs (needs python3)" ON)
if(VEXA_BUILD_MANUALS)
  find_package(Python3 COMPONENTS Interpreter)
endif()

function(vexa_manual target)
  if(NOT VEXA_BUILD_MANUALS OR NOT Python3_FOUND OR VEXA_SANITIZE)
    return()
  endif()
  set(out ${CMAKE_BINARY_DIR}/manuals)
  set(files ${out}/man1/${target}.1 ${out}/bash/${target} ${out}/zsh/_${target} ${out}/fish/${target}.fish)
  add_custom_command(OUTPUT ${files}
    COMMAND ${PROJECT_SOURCE_DIR}/scripts/make_manuals $<TARGET_FILE:${target}> ${out}
    DEPENDS ${target} ${PROJECT_SOURCE_DIR}/scripts/make_manuals
    COMMENT "Making the manual of ${target}" VERBATIM)
  add_custom_target(${target}-manual ALL DEPENDS ${files})
  install(FILES ${out}/man1/${target}.1 DESTINATION ${CMAKE_INSTALL_MANDIR}/man1)
  install(FILES ${out}/bash/${target} DESTINATION ${CMAKE_INSTALL_DATADIR}/bash-completion/completions)
  install(FILES ${out}/zsh/_${target} DESTINATION ${CMAKE_INSTALL_DATADIR}/zsh/vendor-completions)
  install(FILES ${out}/fish/${target}.fish DESTINATION ${CMAKE_INSTALL_DATADIR}/fish/vendor_completions.d)
endfunction()
