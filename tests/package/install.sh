#!/usr/bin/env bash
# An installed tree is enough to build and run a C program, by pkg-config and by CMake.
set -euo pipefail
source_dir=$1 build_dir=$2
work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT

cmake --install "$build_dir" --prefix "$work/prefix" >/dev/null
libdir=$(dirname "$(find "$work/prefix" -name bt_service.pc)")/..
program=$source_dir/tests/package/installed_program.c

flags=$(PKG_CONFIG_PATH=$libdir/pkgconfig pkg-config --cflags --libs bt_service)
cc -std=c99 -Wall -Wextra -Werror "$program" $flags -o "$work/by_pkg_config"
LD_LIBRARY_PATH=$libdir BT_PLATFORM_DOMAIN=install_test_$$ "$work/by_pkg_config"

mkdir "$work/project"
cp "$program" "$work/project/"
cat >"$work/project/CMakeLists.txt" <<'CMAKE'
cmake_minimum_required(VERSION 3.25)
project(installed_program LANGUAGES C)
find_package(bt_service 1 REQUIRED)
add_executable(by_cmake installed_program.c)
target_link_libraries(by_cmake PRIVATE bt_service::BT_Service_API)
CMAKE
cmake -S "$work/project" -B "$work/project/build" -DCMAKE_PREFIX_PATH="$work/prefix" >/dev/null
cmake --build "$work/project/build" >/dev/null
BT_PLATFORM_DOMAIN=install_test_$$ "$work/project/build/by_cmake"
