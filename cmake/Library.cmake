# SPDX-License-Identifier: Apache-2.0
# libVexaCommon.so.1: the driver. Its objects are also put into a static library, vexa_testable, so that tests and
# benchmarks reach the hidden cores.
file(GLOB_RECURSE vexa_sources CONFIGURE_DEPENDS
  ${PROJECT_SOURCE_DIR}/runtime/*.cpp ${PROJECT_SOURCE_DIR}/transport/*.cpp
  ${PROJECT_SOURCE_DIR}/media/*.cpp ${PROJECT_SOURCE_DIR}/device/*.cpp)

add_library(vexa_objects OBJECT ${vexa_sources})
target_include_directories(vexa_objects PUBLIC
  $<BUILD_INTERFACE:${PROJECT_SOURCE_DIR}/include> $<BUILD_INTERFACE:${PROJECT_SOURCE_DIR}>)
target_link_libraries(vexa_objects PRIVATE vexa_warnings PUBLIC VexaCommonFilter Threads::Threads)

vexa_batch(vexa_objects)
vexa_check_locks(vexa_objects)
vexa_instrument(vexa_objects)

add_library(vexa_testable STATIC EXCLUDE_FROM_ALL $<TARGET_OBJECTS:vexa_objects>)
target_include_directories(vexa_testable PUBLIC ${PROJECT_SOURCE_DIR}/include ${PROJECT_SOURCE_DIR})
target_link_libraries(vexa_testable PUBLIC VexaCommonFilter Threads::Threads ${CMAKE_DL_LIBS})

vexa_shared(VexaCommon vexa_objects ${PROJECT_SOURCE_DIR}/cmake/VexaCommon.map)
target_link_libraries(VexaCommon PUBLIC VexaCommonFilter PRIVATE Threads::Threads ${CMAKE_DL_LIBS})
vexa_static(VexaCommon vexa_objects VexaCommonFilterStatic Threads::Threads ${CMAKE_DL_LIBS})

include(cmake/Install.cmake)
