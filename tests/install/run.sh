#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# Installs a build into an empty place and proves it with a host outside the source tree: found by CMake, found by
# pkg-config, compiled as C++14, run. Then looks at what the libraries say of themselves.
#   run.sh BUILD-DIRECTORY
set -euo pipefail
if [[ $# -ne 1 ]]; then
  echo "usage: run.sh BUILD-DIRECTORY" >&2
  exit 2
fi
build=$(cd "$1" && pwd)
here=$(cd "$(dirname "$0")" && pwd)

setting() { sed -nE "s/^$1:[A-Z]+=//p" "$build/CMakeCache.txt"; }
flags=$(setting CMAKE_CXX_FLAGS)
compiler=$(setting CMAKE_CXX_COMPILER)
version=$(setting CMAKE_PROJECT_VERSION)

place=$(mktemp -d)
trap 'rm -rf "$place"' EXIT
prefix=$place/installed

fail() {
  echo "$*" >&2
  exit 1
}

cmake --install "$build" --prefix "$prefix" >"$place/install.log" || fail "$(cat "$place/install.log")"
libraries=$(dirname "$(find "$prefix" -name libVexaCommon.so.1)")
for file in LICENSE NOTICE THIRD_PARTY_NOTICES.md; do
  [[ -n $(find "$prefix" -name "$file") ]] || fail "$file is not installed"
done

echo "-- a host that finds the package with CMake"
cmake -S "$here/host" -B "$place/host" -G Ninja "-DCMAKE_PREFIX_PATH=$prefix" "-DCMAKE_CXX_COMPILER=$compiler" \
  "-DCMAKE_CXX_FLAGS=$flags" >"$place/configure.log" 2>&1 || fail "$(cat "$place/configure.log")"
cmake --build "$place/host" >"$place/build.log" || fail "$(cat "$place/build.log")"
cd "$place"  # hosts open the driver's log where they run
"$place/host/installed_host"

echo "-- a host that finds it with pkg-config"
export PKG_CONFIG_PATH=$libraries/pkgconfig
[[ $(pkg-config --modversion vexa-common) == "$version" ]] || fail "vexa-common has another version than $version"
# The flags are words to the shell: that is what pkg-config and CMAKE_CXX_FLAGS hold.
# shellcheck disable=SC2046,SC2086
"$compiler" $flags -std=c++14 "$here/host/installed_host.cpp" -o "$place/plain_host" \
  $(pkg-config --cflags --libs vexa-session) -ldl
LD_LIBRARY_PATH=$libraries "$place/plain_host"

echo "-- a host that keeps the package elsewhere than it was installed"
mv "$prefix" "$place/moved"
libraries=${libraries/#$prefix/$place/moved}
LD_LIBRARY_PATH=$libraries "$place/plain_host"
export PKG_CONFIG_PATH=$libraries/pkgconfig
[[ -f $(pkg-config --variable=includedir vexa-common)/vexa/vexa.h ]] || fail "pkg-config does not follow the package"

echo "-- names and needs of the libraries"
dynamic() { readelf -d "$1" | sed -nE "s/.*\($2\).*\[(.*)\]/\1/p"; }
check_library() {
  local file=$1 soname=$2 allowed=$3 needed
  [[ $(dynamic "$file" SONAME) == "$soname" ]] || fail "$file calls itself $(dynamic "$file" SONAME)"
  for needed in $(dynamic "$file" NEEDED); do
    [[ $needed =~ ^($allowed)$ ]] || fail "$soname needs $needed"
  done
  if readelf -lW "$file" | grep -q 'GNU_STACK.* RWE'; then fail "$soname asks for an executable stack"; fi
  if readelf -d "$file" | grep -q TEXTREL; then fail "$soname is relocated in its text"; fi
}
system='libstdc\+\+\.so\.6|libm\.so\.6|libgcc_s\.so\.1|libc\.so\.6|libpthread\.so\.0|libdl\.so\.2|ld-linux[-a-z0-9_]*\.so\.2'
check_library "$libraries/libVexaCommon.so.1" libVexaCommon.so.1 "libVexaCommonFilter\.so\.1|$system"
check_library "$libraries/libVexaCommonFilter.so.1" libVexaCommonFilter.so.1 "$system"
check_library "$libraries/libVexaModels.so.1" libVexaModels.so.1 "libVexaCommon(Filter)?\.so\.1|$system"
check_library "$libraries/libVexaSession.so.1" libVexaSession.so.1 "libVexa(Models|Common|CommonFilter)\.so\.1|$system"
dynamic "$libraries/libVexaCommon.so.1" NEEDED | grep -qx 'libVexaCommonFilter.so.1' ||
  fail "libVexaCommon.so.1 does not name the filter library"
echo "installed, found, linked and run${flags:+ with $flags}"
