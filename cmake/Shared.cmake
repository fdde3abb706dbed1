# SPDX-License-Identifier: Apache-2.0
# vexa_shared(LIBRARY OBJECTS MAP): lib<LIBRARY>.so of these objects, with the names that MAP exports; in CMake packages
# Vexa::<name>.
function(vexa_shared library objects map)
  string(REGEX REPLACE "^Vexa" "" name ${library})
  add_library(${library} SHARED $<TARGET_OBJECTS:${objects}>)
  add_library(Vexa::${name} ALIAS ${library})
  target_include_directories(${library} PUBLIC
    $<BUILD_INTERFACE:${PROJECT_SOURCE_DIR}/include> $<INSTALL_INTERFACE:${CMAKE_INSTALL_INCLUDEDIR}>)
  target_compile_features(${library} PUBLIC cxx_std_14)
  target_link_options(${library} PRIVATE LINKER:--version-script=${map})
  if(NOT VEXA_SANITIZE)
    target_link_options(${library} PRIVATE LINKER:-z,defs)
  endif()
  set_target_properties(${library} PROPERTIES SOVERSION ${PROJECT_VERSION_MAJOR} VERSION ${PROJECT_VERSION}
    EXPORT_NAME ${name} LINK_DEPENDS ${map} INSTALL_RPATH "$ORIGIN")
endfunction()
