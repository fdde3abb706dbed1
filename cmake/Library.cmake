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
vexa_measure(vexa_objects)

add_library(vexa_testable STATIC EXCLUDE_FROM_ALL $<TARGET_OBJECTS:vexa_objects>)
target_include_directories(vexa_testable PUBLIC ${PROJECT_SOURCE_DIR}/include ${PROJECT_SOURCE_DIR})
target_link_libraries(vexa_testable PUBLIC VexaCommonFilter Threads::Threads ${CMAKE_DL_LIBS})

add_library(VexaCommon SHARED $<TARGET_OBJECTS:vexa_objects>)
add_library(Vexa::Common ALIAS VexaCommon)
set(vexa_version_script ${PROJECT_SOURCE_DIR}/cmake/VexaCommon.map)
target_include_directories(VexaCommon PUBLIC
  $<BUILD_INTERFACE:${PROJECT_SOURCE_DIR}/include> $<INSTALL_INTERFACE:${CMAKE_INSTALL_INCLUDEDIR}>)
target_compile_features(VexaCommon PUBLIC cxx_std_14)
target_link_libraries(VexaCommon PUBLIC VexaCommonFilter PRIVATE Threads::Threads ${CMAKE_DL_LIBS})
target_link_options(VexaCommon PRIVATE LINKER:--version-script=${vexa_version_script})
if(NOT VEXA_SANITIZE)
  target_link_options(VexaCommon PRIVATE LINKER:-z,defs)
endif()
set_target_properties(VexaCommon PROPERTIES SOVERSION ${PROJECT_VERSION_MAJOR} VERSION ${PROJECT_VERSION}
  EXPORT_NAME Common LINK_DEPENDS ${vexa_version_script})

vexa_static(VexaCommon vexa_objects VexaCommonFilterStatic Threads::Threads ${CMAKE_DL_LIBS})

include(cmake/Install.cmake)
