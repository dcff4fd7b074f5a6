#!/usr/bin/env bash
# Repeats the build with a copy of the sources in another place, and compares every byte of the libraries, or also of kivctl and the
# packages.
# usage: same_bytes.sh BUILD_DIR SOURCE_DIR [packages]
set -euo pipefail
build=$1 sources=$2 packages=${3-} target=kiv_system
[[ $packages ]] && target=all

scratch=$(mktemp -d)
trap 'rm -rf "$scratch"' EXIT
copy=$scratch/a/copy/of/the/sources
mkdir -p "$copy" "$scratch"/{first,second}
cp -r "$sources"/{CMakeLists.txt,LICENSE,cmake,dbus,lib,platform,tools} "$copy"
mapfile -t settings < <(grep -E '^CMAKE_(TOOLCHAIN_FILE|BUILD_TYPE|UNITY_BUILD|CXX_COMPILER|CXX_FLAGS(_[A-Z]+)?|INSTALL_(PREFIX|LIBDIR)):' "$build/CMakeCache.txt")
generator=$(sed -n 's/^CMAKE_GENERATOR:INTERNAL=//p' "$build/CMakeCache.txt") # debug information contains its working directories
cmake -S "$copy" -B "$scratch/b" -G "$generator" "${settings[@]/#/-D}" -DKIV_BUILD_TESTS=OFF >"$scratch/log" 2>&1 &&
    cmake --build "$scratch/b" --parallel 2 --target $target >>"$scratch/log" 2>&1 ||
    { cat "$scratch/log"; exit 1; }

for library in lib/DASystem/libkiv_system.so lib/kiv_util/libkiv_util.so platform/libkiv_platform.so; do
    cmp "$build/$library" "$scratch/b/$library"
done
[[ $packages ]] || exit 0
cmp "$build/tools/kivctl/kivctl" "$scratch/b/tools/kivctl/kivctl"
cpack --config "$build/CPackConfig.cmake" -B "$scratch/first" >>"$scratch/log" 2>&1
cpack --config "$scratch/b/CPackConfig.cmake" -B "$scratch/second" >>"$scratch/log" 2>&1
for package in "$scratch"/first/*.deb; do
    cmp "$package" "$scratch/second/$(basename "$package")"
    sha256sum "$package" | sed "s|$scratch/first/||"
done
