# SPDX-License-Identifier: Apache-2.0
# Headers of other libraries that most files of a target read, compiled once. The libraries that ship, and clang-tidy, go
# without: there each file has to name what it uses.
option(VEXA_PRECOMPILE "Precompile the headers that most files of the tests and tools read" ON)
if(NOT VEXA_PRECOMPILE)
  return()
endif()

set(vexa_standard_headers <algorithm> <chrono> <cstdint> <cstring> <filesystem> <fstream> <functional> <map> <memory>
  <optional> <string> <string_view> <thread> <vector>)
# Through a precompiled header GCC 12 takes its own std::string for ours, and warns of it.
set(vexa_false_alarms)
if(CMAKE_CXX_COMPILER_ID STREQUAL GNU)
  set(vexa_false_alarms -Wno-array-bounds -Wno-restrict -Wno-stringop-overflow -Wno-stringop-overread)
endif()
# The same headers make the same file: the compiler's cache knows by it what was compiled before.
set(vexa_reproducible)
if(CMAKE_CXX_COMPILER_ID MATCHES Clang)
  set(vexa_reproducible "SHELL:-Xclang -fno-pch-timestamp")
endif()

function(vexa_precompile target)
  if(TARGET ${target})
    target_precompile_headers(${target} PRIVATE ${ARGN} ${vexa_standard_headers})
    target_compile_options(${target} PRIVATE ${vexa_false_alarms} ${vexa_reproducible})
  endif()
endfunction()

vexa_precompile(vexa_virtual_camera <asio.hpp> <fmt/format.h>)
vexa_precompile(vexactl_parts <fmt/format.h> <nlohmann/json.hpp>)
vexa_precompile(vexactl <CLI/CLI.hpp> <fmt/format.h> <nlohmann/json.hpp>)
foreach(folder runtime transport media device filter models session virtual_camera host contract)
  vexa_precompile(${folder}_tests <gmock/gmock.h> <gtest/gtest.h>)
endforeach()
