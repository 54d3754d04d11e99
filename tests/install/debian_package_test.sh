#!/usr/bin/env bash
# Makes the Debian package with cpack and checks that it declares what the
# binaries need and holds what an install holds.
set -euo pipefail
build=${1:?usage: debian_package_test.sh BUILD_DIR [PYTHON]}
with_python=${2:+yes}  # an interpreter is given when the build has the Python module
scratch=$(mktemp -d)
trap 'rm -rf "$scratch"' EXIT

cpack -G DEB --config "$build/CPackConfig.cmake" -B "$scratch" >"$scratch/cpack.log" ||
  { cat "$scratch/cpack.log"; exit 1; }
deb=$(echo "$scratch"/*.deb)
dpkg-deb --info "$deb"
depends=$(dpkg-deb --field "$deb" Depends)
for package in libtbb12 libedit2 libstdc++6 ${with_python:+python3-numpy}; do
  [[ $depends == *"$package"* ]] || { echo "Depends lacks $package: $depends"; exit 1; }
done

contents=$(dpkg-deb --contents "$deb" | awk '{print $6}')
for file in usr/lib/libbitfcns.so.1 usr/lib/libzqhost.so.1 usr/bin/bitcalc \
  usr/include/bitfcns/bitfcns/entry_points.hpp usr/lib/cmake/bitfcns/bitfcnsConfig.cmake \
  usr/lib/pkgconfig/bitfcns.pc usr/share/man/man1/bitcalc.1 \
  ${with_python:+usr/lib/python3/dist-packages/bitfcns/__init__.py}; do
  grep -qx "\./$file" <<<"$contents" || { echo "the package lacks /$file"; exit 1; }
done
echo "$(basename "$deb") declares and holds what it should"
