#!/bin/sh
# SPDX-License-Identifier: Apache-2.0
# installed_package.sh CMAKE BUILD_DIR LIBDIR CC SOURCE [FLAGS…]: other builds find an installed copy that was
# moved elsewhere, with find_package and, if available, with pkg-config.
set -eu
cmake=$1 build=$2 libdir=$3 cc=$4 source=$5
shift 5
work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT
"$cmake" --install "$build" --prefix "$work/first" >/dev/null
mv "$work/first" "$work/prefix"

grep -q _dvsctl "$work/prefix/share/bash-completion/completions/dvsctl"

mkdir "$work/consumer"
cat >"$work/consumer/CMakeLists.txt" <<EOF
cmake_minimum_required(VERSION 3.25)
project(consumer LANGUAGES C)
find_package(dvs 1.0 REQUIRED)
find_package(dvs 2 QUIET)
if(dvs_FOUND)
  message(FATAL_ERROR "version 1 was taken for version 2")
endif()
find_package(dvs REQUIRED)
add_executable(program "$source")
target_link_libraries(program PRIVATE dvs::dvs)
EOF
flags=$*
"$cmake" -S "$work/consumer" -B "$work/built" "-DCMAKE_PREFIX_PATH=$work/prefix" "-DCMAKE_C_COMPILER=$cc" \
    "-DCMAKE_C_FLAGS=$flags" >"$work/log" || { cat "$work/log"; exit 1; }
"$cmake" --build "$work/built" >"$work/log" || { cat "$work/log"; exit 1; }
"$work/built/program"
echo "find_package: found, linked and run"

command -v pkg-config >/dev/null || exit 0
export PKG_CONFIG_PATH="$work/prefix/$libdir/pkgconfig"
pkg-config --exists 'libdvs >= 1.0'
# shellcheck disable=SC2046 # splits the flags into words on purpose
"$cc" -std=c11 "$@" $(pkg-config --cflags libdvs) "$source" -o "$work/program" $(pkg-config --libs libdvs) \
    "-Wl,-rpath,$work/prefix/$libdir" "-Wl,-rpath-link,$work/prefix/$libdir"
"$work/program"
echo "pkg-config: found, linked and run"
