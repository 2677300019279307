# SPDX-License-Identifier: Apache-2.0
# The two libraries built from dvs_objects. dvs.symbols lists the exported names: the version script is generated from
# it, and a test compares it with the actual exports of the shared library.

set(DVS_SYMBOLS ${CMAKE_SOURCE_DIR}/dvs.symbols)
set_property(DIRECTORY APPEND PROPERTY CMAKE_CONFIGURE_DEPENDS ${DVS_SYMBOLS})
file(STRINGS ${DVS_SYMBOLS} dvs_names REGEX "^[A-Za-z_]")
list(JOIN dvs_names ";\n    " dvs_globals)
set(DVS_VERSION_SCRIPT ${CMAKE_BINARY_DIR}/dvs.map)
file(WRITE ${DVS_VERSION_SCRIPT} "DVS_1 {\n  global:\n    ${dvs_globals};\n  local:\n    *;\n};\n")

add_library(dvs SHARED $<TARGET_OBJECTS:dvs_objects>)
add_library(dvs::dvs ALIAS dvs)
set_target_properties(dvs PROPERTIES VERSION 1.0.0 SOVERSION 1 LINK_DEPENDS ${DVS_VERSION_SCRIPT}
  INSTALL_RPATH "$ORIGIN") # the platform library is in the same directory
target_include_directories(dvs INTERFACE
  $<BUILD_INTERFACE:${CMAKE_SOURCE_DIR}/include> $<INSTALL_INTERFACE:${CMAKE_INSTALL_INCLUDEDIR}>)
target_link_options(dvs PRIVATE LINKER:--version-script=${DVS_VERSION_SCRIPT})
target_link_libraries(dvs PRIVATE dvs_platform_shared Threads::Threads)

add_library(dvs_static STATIC $<TARGET_OBJECTS:dvs_objects>)
add_library(dvs::dvs_static ALIAS dvs_static)
set_target_properties(dvs_static PROPERTIES OUTPUT_NAME dvs)
target_include_directories(dvs_static INTERFACE
  ${CMAKE_SOURCE_DIR}/include ${CMAKE_SOURCE_DIR}/platform/include ${CMAKE_SOURCE_DIR})
target_link_libraries(dvs_static INTERFACE dvs_platform Threads::Threads)

install(TARGETS dvs dvs_static dvs_platform dvs_platform_shared
  LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR} ARCHIVE DESTINATION ${CMAKE_INSTALL_LIBDIR})
install(DIRECTORY include/dvs DESTINATION ${CMAKE_INSTALL_INCLUDEDIR})

# Package files for the installed copy, relocatable: find_package(dvs) provides the target dvs::dvs, the shared
# library; the pkg-config name is libdvs.
include(CMakePackageConfigHelpers)
set(DVS_PACKAGE_DIR ${CMAKE_INSTALL_LIBDIR}/cmake/dvs)
configure_package_config_file(cmake/dvsConfig.cmake.in ${CMAKE_BINARY_DIR}/dvsConfig.cmake
  INSTALL_DESTINATION ${DVS_PACKAGE_DIR} PATH_VARS CMAKE_INSTALL_INCLUDEDIR CMAKE_INSTALL_LIBDIR
  NO_CHECK_REQUIRED_COMPONENTS_MACRO)
write_basic_package_version_file(${CMAKE_BINARY_DIR}/dvsConfigVersion.cmake COMPATIBILITY SameMajorVersion)
install(FILES ${CMAKE_BINARY_DIR}/dvsConfig.cmake ${CMAKE_BINARY_DIR}/dvsConfigVersion.cmake
  DESTINATION ${DVS_PACKAGE_DIR})
file(RELATIVE_PATH DVS_PREFIX_FROM_PKGCONFIG /${CMAKE_INSTALL_LIBDIR}/pkgconfig /)
configure_file(cmake/libdvs.pc.in ${CMAKE_BINARY_DIR}/libdvs.pc @ONLY)
install(FILES ${CMAKE_BINARY_DIR}/libdvs.pc DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig)
