# SPDX-License-Identifier: Apache-2.0
# vexa_instrument(TARGET): its files count which of their lines and branches run (scripts/coverage), and show libFuzzer the
# paths that an input takes (scripts/fuzz). The libraries' and the fuzz targets' alone: their tests compile as in every
# other build.
option(VEXA_COVERAGE "Count what the tests run of the libraries (needs clang)" OFF)
option(VEXA_BUILD_FUZZ "Build the fuzz targets for libFuzzer (needs clang)" OFF)
if(VEXA_COVERAGE)
  add_link_options(-fprofile-instr-generate)
endif()

function(vexa_instrument target)
  if(VEXA_COVERAGE)
    target_compile_options(${target} PRIVATE -fprofile-instr-generate -fcoverage-mapping)
  endif()
  if(VEXA_BUILD_FUZZ)
    target_compile_options(${target} PRIVATE -fsanitize=fuzzer-no-link)
  endif()
endfunction()
