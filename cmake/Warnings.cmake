# SPDX-License-Identifier: Apache-2.0
# One place for the warnings that every target of ours compiles with. They are errors where CMAKE_COMPILE_WARNING_AS_ERROR
# is on: in the presets, not in a user's build. GCC's sanitizers bring false alarms with them, so builds with them give no
# warnings.
add_library(vexa_warnings INTERFACE)
target_compile_options(vexa_warnings INTERFACE
  -Wall -Wextra -Wpedantic -Wconversion -Wshadow -Wformat=2 -Wformat-nonliteral)
if(CMAKE_CXX_COMPILER_ID STREQUAL GNU AND VEXA_SANITIZE)
  target_compile_options(vexa_warnings INTERFACE -w)
endif()
if(CMAKE_CXX_COMPILER_ID STREQUAL Clang)
  # Clang counts changes of sign among the conversions, GCC does not.
  target_compile_options(vexa_warnings INTERFACE -Wno-sign-conversion)
endif()
# GCC 12 sees overruns inside std::string for 32 bits that are not there (its bugs 105329 and 105651).
if(CMAKE_CXX_COMPILER_ID STREQUAL GNU AND CMAKE_CXX_COMPILER_VERSION VERSION_LESS 13 AND CMAKE_SIZEOF_VOID_P EQUAL 4)
  target_compile_options(vexa_warnings INTERFACE -Wno-array-bounds -Wno-restrict -Wno-stringop-overflow)
endif()

# vexa_check_locks(TARGET): Clang checks the lock annotations. Of the libraries alone: tests look at what they know to be
# theirs without its lock.
function(vexa_check_locks target)
  if(CMAKE_CXX_COMPILER_ID STREQUAL Clang)
    target_compile_options(${target} PRIVATE -Wthread-safety)
  endif()
endfunction()
