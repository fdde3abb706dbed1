# SPDX-License-Identifier: Apache-2.0
# vexa_batch(TARGET): compiles several files of a target in one go, which makes whole builds several times faster:
# scripts/batch_sources writes what includes them. Files with definitions of their own, or made while configuring, stay by
# themselves. An edit may bring a name into a file that its batch has to part or rename; configuring again does so.
set(VEXA_BATCHES OFF CACHE STRING "Compile several files of a target in one go (needs python3): OFF, ON, or TESTS alone")
if(VEXA_BATCHES)
  find_package(Python3 REQUIRED COMPONENTS Interpreter)
endif()

function(vexa_batch target)
  if(NOT VEXA_BATCHES OR (VEXA_BATCHES STREQUAL TESTS AND NOT target MATCHES "_tests$"))
    return()
  endif()
  get_target_property(sources ${target} SOURCES)
  set(files)
  foreach(source ${sources})
    get_source_file_property(definitions ${source} COMPILE_DEFINITIONS)
    get_filename_component(source ${source} ABSOLUTE)
    if(source MATCHES "\\.cpp$" AND NOT definitions AND NOT source MATCHES "^${PROJECT_BINARY_DIR}/")
      list(APPEND files ${source})
    endif()
  endforeach()
  execute_process(
    COMMAND ${Python3_EXECUTABLE} ${PROJECT_SOURCE_DIR}/scripts/batch_sources ${PROJECT_SOURCE_DIR}
      ${CMAKE_CURRENT_BINARY_DIR}/batches/${target} ${files}
    OUTPUT_VARIABLE batches OUTPUT_STRIP_TRAILING_WHITESPACE COMMAND_ERROR_IS_FATAL ANY)
  string(REPLACE "\n" ";" batches "${batches}")
  foreach(batch ${batches})
    string(REPLACE "|" ";" files "${batch}")
    list(POP_FRONT files file)
    set_source_files_properties(${files} PROPERTIES HEADER_FILE_ONLY ON)
    target_sources(${target} PRIVATE ${file})
  endforeach()
endfunction()
