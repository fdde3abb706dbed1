# SPDX-License-Identifier: Apache-2.0
# What makes a flaw that we overlooked harder to use: of everything that ships, checked in the finished files by
# scripts/check_elf. Sanitizers bring checks of their own, which some of these would hide.
if(VEXA_SANITIZE)
  return()
endif()
include(CheckCXXCompilerFlag)

add_compile_options(-fstack-protector-strong -fstack-clash-protection)
check_cxx_compiler_flag(-fcf-protection=full VEXA_HAS_CONTROL_FLOW_PROTECTION)
if(VEXA_HAS_CONTROL_FLOW_PROTECTION)
  add_compile_options(-fcf-protection=full)
endif()
# Level 3 came with GCC 12. It needs an optimising build; a distribution's own setting is left alone.
if(CMAKE_BUILD_TYPE MATCHES "^Rel" AND NOT CMAKE_CXX_FLAGS MATCHES "FORTIFY_SOURCE")
  if(CMAKE_CXX_COMPILER_ID STREQUAL GNU AND CMAKE_CXX_COMPILER_VERSION VERSION_GREATER_EQUAL 12)
    add_compile_definitions(_FORTIFY_SOURCE=3)
  else()
    add_compile_definitions(_FORTIFY_SOURCE=2)
  endif()
endif()
add_link_options(LINKER:-z,relro LINKER:-z,now LINKER:-z,noexecstack)
# Programs are position-independent too.
include(CheckPIESupported)
check_pie_supported(LANGUAGES CXX)
