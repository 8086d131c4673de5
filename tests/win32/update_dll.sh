#!/bin/sh
# Brings the Windows build up to date before its tests, so that they never check a DLL
# older than the Linux build they are compared with. Exits 77 (skipped) when there is no
# Windows build tree (make windows makes one).
set -u
win=${1:?usage: update_dll.sh WIN32_BUILD_DIR}
if [ ! -f "$win/CMakeCache.txt" ]; then
    echo "SKIPPED: no Windows build in $win (make windows)"
    exit 77
fi
log=$(mktemp)
trap 'rm -f "$log"' EXIT
if ! cmake --build "$win" -j 2 >"$log" 2>&1; then
    tail -40 "$log"
    echo "FAILED: the Windows build in $win"
    exit 1
fi
echo "Windows build in $win up to date"
