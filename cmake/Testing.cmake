# SPDX-License-Identifier: Apache-2.0
set(DVS_TEST_TIMEOUT 300 CACHE STRING "Seconds until a test counts as hanging")

# dvs_add_test(NAME <target> SOURCES <files…> [LIBS <targets…>] [LABEL unit|integration] [ARGS <arguments…>])
#
# One GoogleTest program; each of its tests is a separate ctest, so that every test starts with an empty process-wide
# switch table. The label "unit" is for tests that take milliseconds, "integration" for the rest.
function(dvs_add_test)
  cmake_parse_arguments(T "" "NAME;LABEL" "SOURCES;LIBS;ENVIRONMENT" ${ARGN})
  if(NOT T_LABEL)
    set(T_LABEL unit)
  endif()
  add_executable(${T_NAME} ${T_SOURCES})
  target_link_libraries(${T_NAME} PRIVATE dvs_flags ${T_LIBS} dvs::dvs_static dvs::platform GTest::gtest_main)
  target_include_directories(${T_NAME} PRIVATE ${CMAKE_SOURCE_DIR}/tests)
  # Only for sources that use them: other objects are then identical in every checkout, so ccache can share them.
  foreach(source IN LISTS T_SOURCES)
    file(READ ${source} text)
    if(text MATCHES "DVS_(SOURCE|BINARY)_DIR")
      set_source_files_properties(${source} PROPERTIES COMPILE_DEFINITIONS
        "DVS_SOURCE_DIR=\"${CMAKE_SOURCE_DIR}\";DVS_BINARY_DIR=\"${CMAKE_BINARY_DIR}\"")
    endif()
  endforeach()
  gtest_discover_tests(${T_NAME} DISCOVERY_MODE PRE_TEST DISCOVERY_TIMEOUT 60
    PROPERTIES LABELS ${T_LABEL} TIMEOUT ${DVS_TEST_TIMEOUT} ENVIRONMENT "${T_ENVIRONMENT}")
endfunction()
