# One place for the warnings every target of ours compiles with. Sanitizers' instrumentation brings false alarms with it,
# so their builds leave the warnings to the plain ones.
add_library(vexa_warnings INTERFACE)
if(VEXA_SANITIZE)
  target_compile_options(vexa_warnings INTERFACE -w)
  return()
endif()
target_compile_options(vexa_warnings INTERFACE
  -Wall -Wextra -Wpedantic -Wconversion -Wshadow -Wformat=2 -Wformat-nonliteral -Werror)
if(NOT VEXA_UNITY STREQUAL OFF)
  # A name of one file and a local one of another do not meet but here.
  target_compile_options(vexa_warnings INTERFACE -Wno-shadow)
endif()
# GCC 12 sees overruns inside std::string for 32 bits that are not there (its bugs 105329 and 105651).
if(CMAKE_CXX_COMPILER_ID STREQUAL GNU AND CMAKE_CXX_COMPILER_VERSION VERSION_LESS 13 AND CMAKE_SIZEOF_VOID_P EQUAL 4)
  target_compile_options(vexa_warnings INTERFACE -Wno-array-bounds -Wno-restrict -Wno-stringop-overflow)
endif()
