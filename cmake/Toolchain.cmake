# SPDX-License-Identifier: Apache-2.0
# Compiler settings for all targets of this tree, in the interface target dvs_flags.

find_program(CCACHE_PROGRAM ccache)
if(CCACHE_PROGRAM)
  set(CMAKE_C_COMPILER_LAUNCHER ${CCACHE_PROGRAM})
  set(CMAKE_CXX_COMPILER_LAUNCHER ${CCACHE_PROGRAM})
endif()

# Test builds link dozens of programs with debug information: mold needs a third of the default linker's time.
# Installed binaries use the default linker.
find_program(MOLD_PROGRAM mold)
if(MOLD_PROGRAM AND CMAKE_BUILD_TYPE STREQUAL "Debug")
  add_link_options(-fuse-ld=mold)
endif()

add_library(dvs_flags INTERFACE)
target_compile_options(dvs_flags INTERFACE -Wall -Wextra -Wpedantic -Wconversion -Wshadow)
if(DVS_WERROR)
  target_compile_options(dvs_flags INTERFACE -Werror)
endif()

# Sanitizers and coverage must cover every object of a program, so they are set for the whole tree. -g1 overrides the
# -g of the build type: reports show functions and lines. Debug builds keep variable names, which make up most of the
# debug information to write and link.
if(DVS_SANITIZE)
  add_compile_options(-fsanitize=${DVS_SANITIZE} -fno-sanitize-recover=all -fno-omit-frame-pointer -O1 -g1)
  add_link_options(-fsanitize=${DVS_SANITIZE})
  if(DVS_SANITIZE MATCHES "undefined" AND CMAKE_CXX_COMPILER_ID STREQUAL "GNU")
    # With any of these three, gcc does not accept the address of a constant as a constant expression, and the tables
    # that are checked at compile time do not compile. AddressSanitizer also detects the null accesses they would find.
    add_compile_options(-fno-sanitize=null,nonnull-attribute,returns-nonnull-attribute)
  endif()
endif()
if(DVS_COVERAGE)
  add_compile_options(--coverage -fprofile-update=atomic)
  add_link_options(--coverage)
endif()

# Bounds checks of the standard library in debug builds, of the C library in release builds.
add_compile_definitions($<$<CONFIG:Debug>:_GLIBCXX_ASSERTIONS> $<$<CONFIG:Release>:_FORTIFY_SOURCE=2>)
add_compile_options($<$<CONFIG:Release>:-fstack-protector-strong>)
add_link_options(LINKER:-z,relro,-z,now)
