#!/usr/bin/env bash
# Installs the build tree into a fresh prefix, then builds a small consumer against it
# twice (find_package and pkg-config) and runs both. Then makes the Debian package, unpacks
# it into a scratch root (never onto the system) and builds the consumer against that.
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

# The Debian package: its files, and a consumer built against its unpacked /usr.
(cd "$work" && cpack -G DEB --config "$build/CPackConfig.cmake" -B "$work/deb" >/dev/null)
deb=$(ls "$work"/deb/venlomer_*.deb)
dpkg-deb -f "$deb" Package | grep -qx venlomer
dpkg-deb -f "$deb" Depends | grep -q 'libre2'
dpkg-deb -c "$deb" > "$work/deb-files.txt"
for file in ./usr/bin/venlomer ./usr/share/venlomer/rareroded.acd \
            ./usr/include/venlomer/s/CStringContainer.h ./usr/include/venlomer/VnI/Ids.h; do
  grep -q " $file\$" "$work/deb-files.txt" || { echo "package lacks $file" >&2; exit 1; }
done
if grep -q '/s/internal/' "$work/deb-files.txt"; then
  echo "package ships private headers" >&2
  exit 1
fi
dpkg-deb -x "$deb" "$work/debroot"
cmake -S "$consumer" -B "$work/deb-cmake" -DCMAKE_PREFIX_PATH="$work/debroot/usr" >/dev/null
cmake --build "$work/deb-cmake" >/dev/null
"$work/deb-cmake/consumer" | grep -q 'consumer: 2 texts'
echo "install test: installed tree (find_package, pkg-config) and Debian package consumers built and ran"
