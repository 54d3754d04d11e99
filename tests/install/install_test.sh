#!/usr/bin/env bash
# Installs the build into a scratch prefix and uses it from there only:
# bitcalc runs by its RPATH, one consumer builds with find_package(bitfcns),
# another with a plain compiler line from pkg-config, and the Python package
# imports from the prefix's Python path when the build has one.
set -euo pipefail
usage="usage: install_test.sh BUILD_DIR CXX [PYTHON]"
build=${1:?$usage}
cxx=${2:?$usage}
python=${3:-}  # the interpreter of the Python package, when the build has one
here=$(cd "$(dirname "$0")" && pwd)
scratch=$(mktemp -d)
trap 'rm -rf "$scratch"' EXIT
prefix=$scratch/prefix

step() { echo "== $*"; }

step "cmake --install into $prefix"
cmake --install "$build" --prefix "$prefix" >"$scratch/install.log"
for lib in bitfcns zqhost; do
  soname=$(readelf -d "$prefix/lib/lib$lib.so" | sed -n 's/.*(SONAME).*\[\(.*\)\]/\1/p')
  [[ $soname == lib$lib.so.[0-9]* && -e $prefix/lib/$soname ]] ||
    { echo "lib$lib.so has the SONAME '$soname', which the prefix doesn't hold"; exit 1; }
done

step "installed bitcalc"
env -u LD_LIBRARY_PATH "$prefix/bin/bitcalc" --version
[[ $("$prefix/bin/bitcalc" --canonical -e 'bitand(12, 10)') == 'ans = double 1x1 [8]' ]]

step "consumer built with find_package(bitfcns)"
cmake -S "$here/consumer" -B "$scratch/cmake-consumer" -DCMAKE_PREFIX_PATH="$prefix" \
  -DCMAKE_CXX_COMPILER="$cxx" -DCMAKE_FIND_USE_PACKAGE_REGISTRY=OFF >"$scratch/configure.log"
cmake --build "$scratch/cmake-consumer" >"$scratch/build.log"
"$scratch/cmake-consumer/consumer"

step "consumer built with a compiler line from pkg-config"
export PKG_CONFIG_PATH=$prefix/lib/pkgconfig
# shellcheck disable=SC2046
"$cxx" -std=c++20 -o "$scratch/pc-consumer" "$here/consumer/consumer.cpp" \
  $(pkg-config --cflags --libs bitfcns) -Wl,-rpath,"$(pkg-config --variable=libdir bitfcns)"
"$scratch/pc-consumer"

if [[ -n $python ]]; then
  step "the Python package from the prefix's Python path"
  site=$("$python" -c 'import sys, sysconfig
print(sysconfig.get_path("platlib", "posix_prefix", {"base": sys.argv[1], "platbase": sys.argv[1]}))' "$prefix")
  PYTHONPATH=$site "$python" - "$prefix" <<'EOF'
import sys
import numpy as np
import bitfcns
import bitfcns.dask

assert bitfcns.__file__.startswith(sys.argv[1]), bitfcns.__file__
assert len(bitfcns.available_functions()) == 7, bitfcns.available_functions()
assert bitfcns.bitshift(np.array([12, 10, 255], np.uint8), -2).tolist() == [3, 2, 63]
print("python   ok")
EOF
fi
