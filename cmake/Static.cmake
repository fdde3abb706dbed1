# vexa_static(LIBRARY OBJECTS [LINKS...]): lib<LIBRARY>.a beside the shared library, of the same objects; in CMake packages
# Vexa::<name>Static. Hosts that link it link the libraries that it needs as well: pkg-config --static names them.
function(vexa_static library objects)
  if(NOT VEXA_BUILD_STATIC)
    return()
  endif()
  string(REPLACE "Vexa" "" name ${library})
  add_library(${library}Static STATIC $<TARGET_OBJECTS:${objects}>)
  target_include_directories(${library}Static PUBLIC
    $<BUILD_INTERFACE:${PROJECT_SOURCE_DIR}/include> $<INSTALL_INTERFACE:${CMAKE_INSTALL_INCLUDEDIR}>)
  target_compile_features(${library}Static PUBLIC cxx_std_14)
  target_link_libraries(${library}Static PUBLIC ${ARGN})
  set_target_properties(${library}Static PROPERTIES OUTPUT_NAME ${library} EXPORT_NAME ${name}Static)
  install(TARGETS ${library}Static EXPORT VexaCommonTargets ARCHIVE DESTINATION ${CMAKE_INSTALL_LIBDIR})
endfunction()
