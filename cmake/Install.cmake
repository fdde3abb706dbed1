# SPDX-License-Identifier: Apache-2.0
# What a host developer gets: headers, the libraries, a CMake package, pkg-config files, the licence and the documents.
include(CMakePackageConfigHelpers)

install(TARGETS VexaCommon VexaCommonFilter EXPORT VexaCommonTargets
  LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR} RUNTIME DESTINATION ${CMAKE_INSTALL_BINDIR})
install(DIRECTORY ${PROJECT_SOURCE_DIR}/include/vexa DESTINATION ${CMAKE_INSTALL_INCLUDEDIR} FILES_MATCHING PATTERN "*.h")
install(FILES ${PROJECT_SOURCE_DIR}/LICENSE ${PROJECT_SOURCE_DIR}/NOTICE ${PROJECT_SOURCE_DIR}/THIRD_PARTY_NOTICES.md
  ${PROJECT_SOURCE_DIR}/README.md ${PROJECT_SOURCE_DIR}/CHANGELOG.md DESTINATION ${CMAKE_INSTALL_DOCDIR})
install(DIRECTORY ${PROJECT_SOURCE_DIR}/docs DESTINATION ${CMAKE_INSTALL_DOCDIR}
  FILES_MATCHING PATTERN "*.md" PATTERN "*.png" PATTERN "*.json")
install(DIRECTORY ${PROJECT_SOURCE_DIR}/host/example DESTINATION ${CMAKE_INSTALL_DOCDIR})
install(EXPORT VexaCommonTargets NAMESPACE Vexa:: DESTINATION ${CMAKE_INSTALL_LIBDIR}/cmake/VexaCommon)

configure_package_config_file(cmake/VexaCommonConfig.cmake.in ${CMAKE_BINARY_DIR}/VexaCommonConfig.cmake
  INSTALL_DESTINATION ${CMAKE_INSTALL_LIBDIR}/cmake/VexaCommon)
write_basic_package_version_file(${CMAKE_BINARY_DIR}/VexaCommonConfigVersion.cmake COMPATIBILITY SameMajorVersion)
install(FILES ${CMAKE_BINARY_DIR}/VexaCommonConfig.cmake ${CMAKE_BINARY_DIR}/VexaCommonConfigVersion.cmake
  DESTINATION ${CMAKE_INSTALL_LIBDIR}/cmake/VexaCommon)

file(RELATIVE_PATH vexa_prefix_from_pkgconfig /${CMAKE_INSTALL_LIBDIR}/pkgconfig /)
string(REGEX REPLACE "/$" "" vexa_prefix_from_pkgconfig ${vexa_prefix_from_pkgconfig})
configure_file(cmake/vexa-common.pc.in ${CMAKE_BINARY_DIR}/vexa-common.pc @ONLY)
install(FILES ${CMAKE_BINARY_DIR}/vexa-common.pc DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig)
