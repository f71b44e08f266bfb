#!/usr/bin/env bash
# Installs the build tree into a fresh prefix, then builds a small consumer against it
# twice (find_package and pkg-config) and runs both. Then makes the Debian package the way
# the package preset does, unpacks it into a scratch root (never onto the system), builds
# the consumer against that and checks that the unpacked library looks for its data in
# /usr/share/venlomer, where the installed package puts it.
set -euo pipefail
build=$1 consumer=$2 work=$3 source=$4 build_type=${5:-} werror=${6:-OFF}
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

# This tree's library looks for its data under its own prefix, so cpack refuses to pack
# it for /usr.
if (cd "$work" && cpack -G DEB --config "$build/CPackConfig.cmake" -B "$work/refused") \
     >"$work/refused.log" 2>&1; then
  echo "cpack packed a tree configured for another prefix than /usr" >&2
  exit 1
fi
grep -q "configured for the prefix" "$work/refused.log"

# The Debian package from the package preset's configuration, compiled as this tree is so
# that the compiler cache can serve it, in a tree kept between runs so that a rerun
# rebuilds only what changed: its files, and a consumer built against its unpacked /usr.
package="${work%/}-package"
cmake -S "$source" --preset package -B "$package" -DCMAKE_BUILD_TYPE="$build_type" \
  -DVENLOMER_WERROR="$werror" >/dev/null
cmake --build "$package" -j 2 >/dev/null
(cd "$work" && cpack -G DEB --config "$package/CPackConfig.cmake" -B "$work/deb" >/dev/null)
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

# The folder the unpacked library was built to search: the package's own, never the
# prefix of the tree it was built in.
devdata=$(find "$work/debroot/usr" -name 'libvenlomer_devdata.so.*.*' | head -n1)
strings -a "$devdata" > "$work/devdata-strings.txt"
grep -qx /usr/share/venlomer "$work/devdata-strings.txt" \
  || { echo "the packaged library does not look in /usr/share/venlomer" >&2; exit 1; }
if grep '/share/venlomer$' "$work/devdata-strings.txt" | grep -vqx /usr/share/venlomer; then
  echo "the packaged library looks in another data folder too" >&2
  exit 1
fi
# And it finds its data there with no environment: in a mount namespace whose
# /usr/share/venlomer is the package's, from a folder without a scheme file. Where no
# namespace can be made (no privilege), the check above stands alone.
mkdir -p "$work/elsewhere"
if unshare -m true 2>/dev/null; then
  found=$(cd "$work/elsewhere" && env -u VENLOMER_DATA_PATH unshare -m sh -c \
    'mount -t tmpfs none /usr/share && mkdir /usr/share/venlomer &&
     mount --bind "$1" /usr/share/venlomer && exec "$2"' \
    sh "$work/debroot/usr/share/venlomer" "$work/deb-cmake/consumer")
  echo "$found" | grep -qx 'consumer: colour scheme read from /usr/share/venlomer/rareroded.acd' \
    || { echo "the packaged library did not read /usr/share/venlomer: $found" >&2; exit 1; }
else
  echo "install test: no mount namespace; the packaged data folder was checked in the library only"
fi
echo "install test: installed tree (find_package, pkg-config) and Debian package consumers built and ran"
