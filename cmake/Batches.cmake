# SPDX-License-Identifier: Apache-2.0
# vexa_batch(TARGET): compiles several files of a target in one go, which makes whole builds several times faster. Files
# that keep the same name to themselves never share a batch: scripts/batch_sources. An edit may bring such a name in;
# configuring again puts the files into other batches.
set(VEXA_BATCHES OFF CACHE STRING "Compile several files of a target in one go (needs python3): OFF, ON, or TESTS alone")
if(VEXA_BATCHES)
  find_package(Python3 REQUIRED COMPONENTS Interpreter)
endif()

function(vexa_batch target)
  if(NOT VEXA_BATCHES OR (VEXA_BATCHES STREQUAL TESTS AND NOT target MATCHES "_tests$"))
    return()
  endif()
  get_target_property(sources ${target} SOURCES)
  list(FILTER sources INCLUDE REGEX "\\.cpp$")
  set(files)
  foreach(source ${sources})
    get_filename_component(source ${source} ABSOLUTE)
    list(APPEND files ${source})
  endforeach()
  execute_process(
    COMMAND ${Python3_EXECUTABLE} ${PROJECT_SOURCE_DIR}/scripts/batch_sources ${PROJECT_SOURCE_DIR} ${files}
    OUTPUT_VARIABLE batches OUTPUT_STRIP_TRAILING_WHITESPACE COMMAND_ERROR_IS_FATAL ANY)
  string(REPLACE "\n" ";" batches "${batches}")
  set(number 0)
  foreach(batch ${batches})
    math(EXPR number "${number} + 1")
    string(REPLACE "|" ";" batch "${batch}")
    list(LENGTH batch count)
    if(count GREATER 1)
      set_source_files_properties(${batch} PROPERTIES UNITY_GROUP ${target}_${number})
    endif()
  endforeach()
  set_target_properties(${target} PROPERTIES UNITY_BUILD ON UNITY_BUILD_MODE GROUP)
endfunction()
