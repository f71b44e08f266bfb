#!/usr/bin/env bash
# Installs the build tree into a fresh prefix, then builds a small consumer against it
# twice (find_package and pkg-config) and runs both.
set -euo pipefail
build=$1 consumer=$2 work=$3
rm -rf "$work"
mkdir -p "$work"
prefix="$work/prefix"
cmake --install "$build" --prefix "$prefix" >/dev/null

lib=$(ls -d "$prefix"/lib*/ | head -n1)
test -L "$lib/libvenlomer.so"
readelf -d "$lib/libvenlomer.so" | grep -q 'SONAME.*libvenlomer.so.0'
test -f "$lib/cmake/Venlomer/VenlomerConfig.cmake"
test -f "$lib/pkgconfig/venlomer.pc"

cmake -S "$consumer" -B "$work/cmake" -DCMAKE_PREFIX_PATH="$prefix" >/dev/null
cmake --build "$work/cmake" >/dev/null
"$work/cmake/consumer" | grep -q 'consumer: 2 texts'

PKG_CONFIG_PATH="$lib/pkgconfig" c++ "$consumer/main.cpp" -o "$work/pc-consumer" \
  $(PKG_CONFIG_PATH="$lib/pkgconfig" pkg-config --cflags --libs venlomer) -Wl,-rpath,"$lib"
"$work/pc-consumer" | grep -q 'consumer: 2 texts'
echo "install test: both consumers built and ran"
