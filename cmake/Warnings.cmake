# One place for the warnings every target of ours compiles with. Sanitizers' instrumentation brings false alarms with it
# where code is optimised, so in their builds only targets without optimisation, which say so by VEXA_UNOPTIMISED, are
# warned of anything.
add_library(vexa_warnings INTERFACE)
set(vexa_warning_options
  -Wall -Wextra -Wpedantic -Wconversion -Wshadow -Wformat=2 -Wformat-nonliteral -Werror)
if(NOT VEXA_UNITY STREQUAL OFF)
  # A name of one file and a local one of another do not meet but here.
  list(APPEND vexa_warning_options -Wno-shadow)
endif()
# GCC 12 sees overruns inside std::string for 32 bits that are not there (its bugs 105329 and 105651).
if(CMAKE_CXX_COMPILER_ID STREQUAL GNU AND CMAKE_CXX_COMPILER_VERSION VERSION_LESS 13 AND CMAKE_SIZEOF_VOID_P EQUAL 4)
  list(APPEND vexa_warning_options -Wno-array-bounds -Wno-restrict -Wno-stringop-overflow)
endif()
if(VEXA_SANITIZE)
  target_compile_options(vexa_warnings INTERFACE
    "$<IF:$<BOOL:$<TARGET_PROPERTY:VEXA_UNOPTIMISED>>,${vexa_warning_options},-w>")
else()
  target_compile_options(vexa_warnings INTERFACE ${vexa_warning_options})
endif()
