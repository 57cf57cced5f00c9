#!/usr/bin/env bash
# Installs what the 32-bit Windows build needs: the mingw-w64 cross compiler, wine, and
# Poco Foundation cross-built from Debian's own source package into a sysroot.
# Idempotent: installed packages and an existing sysroot are reused.
# Usage: scripts/install-windows-deps.sh [--packages-only] [SYSROOT]   (default: build-windows/sysroot)
set -euo pipefail

packages_only=false
if [ "${1:-}" = "--packages-only" ]; then packages_only=true; shift; fi
top=$(cd "$(dirname "$0")/.." && pwd)
sysroot=$(realpath -m "${1:-$top/build-windows/sysroot}")
work=$(dirname "$sysroot")/poco-src
triplet=i686-w64-mingw32

if [ "$(id -u)" -eq 0 ]; then as_root=(); else as_root=(sudo); fi
export DEBIAN_FRONTEND=noninteractive

installed() { dpkg-query -W -f='${Status}' "$1" 2>/dev/null | grep -q '^install ok installed$'; }

# The i386 index of the security suite has been seen inconsistent (apt-get update exits 100);
# the main suite alone carries everything needed, so updates are allowed to fail and
# packages come from bookworm explicitly.
apt_update() { "${as_root[@]}" apt-get update -q || echo "install-windows-deps: apt-get update reported errors; continuing with bookworm"; }

install_packages() {
  local missing=()
  for p in "$@"; do installed "$p" || missing+=("$p"); done
  [ ${#missing[@]} -eq 0 ] && return 0
  apt_update
  "${as_root[@]}" apt-get install -y -q --no-install-recommends -t bookworm "${missing[@]}"
}

if ! dpkg --print-foreign-architectures | grep -qx i386; then
  "${as_root[@]}" dpkg --add-architecture i386
fi
install_packages g++-mingw-w64-i686-posix mingw-w64-i686-dev binutils-mingw-w64-i686 dpkg-dev rapidjson-dev
install_packages wine wine32:i386
$packages_only && exit 0

if [ -f "$sysroot/lib/libPocoFoundation.a" ] || [ -f "$sysroot/lib/libPocoFoundationmt.a" ]; then
  echo "install-windows-deps: Poco Foundation already in $sysroot"
  exit 0
fi

# Source entries mirroring the binary ones, so that `apt-get source` finds Debian's Poco.
src_list=/etc/apt/sources.list.d/vexil-deb-src.sources
if [ ! -f "$src_list" ]; then
  sed 's/^Types: deb$/Types: deb-src/' /etc/apt/sources.list.d/debian.sources | "${as_root[@]}" tee "$src_list" >/dev/null
  apt_update
fi

rm -rf "$work"
mkdir -p "$work"
(cd "$work" && apt-get source -q --download-only poco >/dev/null && dpkg-source -x --no-check ./poco_*.dsc poco >/dev/null)
src="$work/poco"

# mingw's headers are lower case; Poco includes two of them in mixed case.
sed -i -e 's/<winsock2\.h>/<winsock2.h>/I' -e 's/<iphlpapi\.h>/<iphlpapi.h>/I' \
  "$src/Foundation/include/Poco/UnWindows.h"

cat > "$work/toolchain.cmake" <<TOOLCHAIN
set(CMAKE_SYSTEM_NAME Windows)
set(CMAKE_SYSTEM_PROCESSOR i686)
set(CMAKE_C_COMPILER $triplet-gcc-posix)
set(CMAKE_CXX_COMPILER $triplet-g++-posix)
set(CMAKE_RC_COMPILER $triplet-windres)
set(CMAKE_MC_COMPILER $triplet-windmc)
set(CMAKE_FIND_ROOT_PATH /usr/$triplet)
set(CMAKE_FIND_ROOT_PATH_MODE_PROGRAM NEVER)
set(CMAKE_FIND_ROOT_PATH_MODE_LIBRARY ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_INCLUDE ONLY)
TOOLCHAIN

cmake -S "$src" -B "$work/build" -G Ninja \
  -DCMAKE_TOOLCHAIN_FILE="$work/toolchain.cmake" -DCMAKE_BUILD_TYPE=Release \
  -DCMAKE_INSTALL_PREFIX="$sysroot" -DBUILD_SHARED_LIBS=OFF \
  -DENABLE_FOUNDATION=ON -DENABLE_XML=OFF -DENABLE_JSON=OFF -DENABLE_NET=OFF -DENABLE_NETSSL=OFF \
  -DENABLE_CRYPTO=OFF -DENABLE_JWT=OFF -DENABLE_DATA=OFF -DENABLE_DATA_SQLITE=OFF -DENABLE_DATA_MYSQL=OFF \
  -DENABLE_DATA_POSTGRESQL=OFF -DENABLE_DATA_ODBC=OFF -DENABLE_MONGODB=OFF -DENABLE_REDIS=OFF \
  -DENABLE_PDF=OFF -DENABLE_UTIL=OFF -DENABLE_ZIP=OFF -DENABLE_SEVENZIP=OFF -DENABLE_APACHECONNECTOR=OFF \
  -DENABLE_CPPPARSER=OFF -DENABLE_ENCODINGS=OFF -DENABLE_ENCODINGS_COMPILER=OFF -DENABLE_PAGECOMPILER=OFF \
  -DENABLE_PAGECOMPILER_FILE2PAGE=OFF -DENABLE_POCODOC=OFF -DENABLE_TESTS=OFF -DENABLE_ACTIVERECORD=OFF \
  -DENABLE_ACTIVERECORD_COMPILER=OFF -DENABLE_PROMETHEUS=OFF -DPOCO_UNBUNDLED=OFF >/dev/null
cmake --build "$work/build"
cmake --install "$work/build" >/dev/null
echo "install-windows-deps: Poco Foundation installed in $sysroot"
