# Headers that most files of a target read, compiled once for each. Left out under a compiler cache, which would find
# nothing to keep, and for the library itself, which is to see every warning.
option(VEXA_PRECOMPILE "Precompile the headers that most tests read" ON)
if(NOT VEXA_PRECOMPILE OR NOT VEXA_UNITY STREQUAL OFF OR CMAKE_CXX_COMPILER_LAUNCHER)
  return()
endif()

set(vexa_precompiled <algorithm> <chrono> <cstdint> <cstring> <map> <memory> <optional> <string> <string_view> <vector>)
# Through a precompiled header GCC 12 takes its own std::string for ours, and warns of it.
set(vexa_false_alarms -Wno-array-bounds -Wno-restrict -Wno-stringop-overflow -Wno-stringop-overread)

if(TARGET vexa_virtual_camera)
  target_precompile_headers(vexa_virtual_camera PRIVATE <asio.hpp> <fmt/format.h> <functional> ${vexa_precompiled})
  target_compile_options(vexa_virtual_camera PRIVATE ${vexa_false_alarms})
endif()
foreach(folder runtime transport media device filter models virtual_camera host contract)
  if(TARGET ${folder}_tests)
    target_precompile_headers(${folder}_tests PRIVATE
      <gmock/gmock.h> <gtest/gtest.h> <fstream> <filesystem> <thread> ${vexa_precompiled})
    target_compile_options(${folder}_tests PRIVATE ${vexa_false_alarms})
  endif()
endforeach()
