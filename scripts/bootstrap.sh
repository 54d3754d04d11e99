#!/usr/bin/env bash
# Installs the Debian packages the build needs, where they are missing, then
# configures and builds the given CMake presets (default: release).
set -euo pipefail
cd "$(dirname "$0")/.."

packages=(g++ clang-14 libclang-rt-14-dev cmake make libtbb-dev libboost-dev libgtest-dev libbenchmark-dev libedit-dev)
# The Python module and its tests, for Debian's /usr/bin/python3.
packages+=(python3-dev pybind11-dev python3-numpy python3-pytest python3-hypothesis python3-dask
  python3-distributed python3-matplotlib python3-mypy)
# The tests of the installed tree and of the Debian package.
packages+=(pkg-config dpkg-dev file)
missing=()
for p in "${packages[@]}"; do
  dpkg-query -W -f='${Status}' "$p" 2>/dev/null | grep -q 'install ok installed' || missing+=("$p")
done
if ((${#missing[@]})); then
  echo "bootstrap: installing ${missing[*]}" >&2
  sudo=()
  [[ $(id -u) -eq 0 ]] || sudo=(sudo)
  export DEBIAN_FRONTEND=noninteractive
  "${sudo[@]}" apt-get install -y --no-install-recommends "${missing[@]}" ||
    { "${sudo[@]}" apt-get update && "${sudo[@]}" apt-get install -y --no-install-recommends "${missing[@]}"; }
fi

jobs=$(nproc)
for preset in "${@:-release}"; do
  cmake --preset "$preset" >/dev/null
  cmake --build --preset "$preset" -j "$jobs"
done
