#!/bin/sh
# Installs the build into a scratch prefix and builds a tiny host against it twice, once with
# pkg-config and once with CMake's find_package(Vantrel), then runs both.
#   check_install.sh BUILD_DIR SCRATCH_DIR
set -eu
build=${1:?usage: check_install.sh BUILD_DIR SCRATCH_DIR}
scratch=${2:?}
here=$(cd "$(dirname "$0")" && pwd)
rm -rf "$scratch"
mkdir -p "$scratch"
prefix="$scratch/prefix"
cmake --install "$build" --prefix "$prefix" >"$scratch/install.log"
libdir=$(dirname "$(find "$prefix" -name 'libvantrel.so' | head -1)")
[ -n "$libdir" ] || { echo "FAILED: no libvantrel.so installed"; exit 1; }
# The runtime carries its soname and version; the unversioned name is the development link.
[ -L "$libdir/libvantrel.so" ] && [ -f "$libdir/libvantrel.so.0" ] || { echo "FAILED: soname links"; ls -l "$libdir"; exit 1; }

if command -v pkg-config >/dev/null 2>&1; then
    export PKG_CONFIG_PATH="$libdir/pkgconfig"
    # shellcheck disable=SC2046
    cc -o "$scratch/host-pc" "$here/tiny_host.c" $(pkg-config --cflags --libs vantrel)
    LD_LIBRARY_PATH="$libdir" "$scratch/host-pc"
else
    echo "no pkg-config: the pkg-config build is not tried"
fi

mkdir -p "$scratch/cmake-host"
cp "$here/tiny_host.c" "$scratch/cmake-host/"
cp "$here/CMakeLists.txt.in" "$scratch/cmake-host/CMakeLists.txt"
cmake -S "$scratch/cmake-host" -B "$scratch/cmake-host/build" -DCMAKE_PREFIX_PATH="$prefix" >"$scratch/cmake.log"
cmake --build "$scratch/cmake-host/build" >>"$scratch/cmake.log"
LD_LIBRARY_PATH="$libdir" "$scratch/cmake-host/build/tiny_host"
# The command and its man page come with the runtime.
"$prefix/bin/vantrel" --version | grep -q "^vantrel " || { echo "FAILED: no working bin/vantrel"; exit 1; }
[ -s "$prefix/share/man/man1/vantrel.1" ] || { echo "FAILED: no man page"; exit 1; }
echo "installed tree usable with pkg-config and CMake; bin/vantrel and its man page in place"
