# SPDX-License-Identifier: Apache-2.0
# vexa_measure(TARGET): its files count which of their lines and branches run: scripts/coverage. Of the libraries alone, so
# that their tests compile as in every other build.
option(VEXA_COVERAGE "Count what the tests run of the libraries (needs clang)" OFF)
if(VEXA_COVERAGE)
  add_link_options(-fprofile-instr-generate)
endif()

function(vexa_measure target)
  if(VEXA_COVERAGE)
    target_compile_options(${target} PRIVATE -fprofile-instr-generate -fcoverage-mapping)
  endif()
endfunction()
