#!/bin/sh
# Runs the 32-bit Windows test host under Wine against the Linux build's answers.
#   run_wine.sh REFERENCE_EXE WIN32_BUILD_DIR OUT_DIR FIXTURE_DIR COLOUR_DIR
# The Linux reference program runs the scenario first and writes the expected transcript
# and files; the host then runs the same scenario through vantrel.dll and compares.
# Exits 77 (skipped) when the Windows build or a Wine that runs 32-bit programs is missing.
set -u
reference=${1:?usage: run_wine.sh REFERENCE_EXE WIN32_BUILD_DIR OUT_DIR FIXTURE_DIR COLOUR_DIR}
win=${2:?} out=${3:?} fixtures=${4:?} colour=${5:?}
host=vantrel_win32_host.exe

skip() {
    echo "SKIPPED: $*"
    exit 77
}

rm -rf "$out"
mkdir -p "$out/linux" "$out/windows" || exit 1
if ! "$reference" "$out/linux/" "$fixtures/" "$colour/" "$out/linux.txt"; then
    echo "FAILED: the Linux reference run"
    exit 1
fi

[ -f "$win/vantrel.dll" ] && [ -f "$win/$host" ] || skip "no Windows build in $win (make windows)"
command -v wine >/dev/null 2>&1 || skip "Wine is not installed (make test as root installs it)"

# The prefix lives in the build tree; booting it once takes a few seconds to a minute.
export WINEPREFIX="$win/wineprefix"
export WINEDEBUG=-all
# No browser or .NET runtime in the prefix: without this the first boot offers to fetch them.
export WINEDLLOVERRIDES="mscoree=;mshtml="
unset DISPLAY
if [ ! -f "$WINEPREFIX/system.reg" ]; then
    echo "booting the Wine prefix $WINEPREFIX"
    timeout 600 wineboot -i >"$out/wineboot.log" 2>&1 || {
        tail -20 "$out/wineboot.log"
        skip "wineboot could not set up $WINEPREFIX"
    }
fi

cd "$win" || exit 1
# Without arguments the host prints its usage and exits 2: proof that Wine starts a 32-bit program.
timeout 300 wine "$host" >"$out/probe.log" 2>&1
if [ $? -ne 2 ]; then
    tail -5 "$out/probe.log"
    skip "Wine cannot start 32-bit Windows programs here (wine32:i386 missing, or this kernel runs no i386 code and no emulator is registered: make test as root sets both up)"
fi

# Wine maps the Linux root to drive Z:.
timeout 600 wine "$host" "Z:$out/linux.txt" "Z:$out/linux/" "Z:$out/windows/" "Z:$fixtures/" "Z:$colour/" \
    "Z:$out/windows.txt"
host_status=$?
status=$host_status
# Wine takes the regional settings from LC_ALL: a German user writes decimal commas.
for setting in "C ." "de_DE.UTF-8 ,"; do
    set -- $setting
    LC_ALL=$1 timeout 300 wine vantrel_win32_platform_check.exe "$2" || status=1
done
# Let the prefix's server and services end before the test ends, so nothing holds its output open.
wineserver -w
if [ "$host_status" -ne 0 ] && [ -f "$out/windows.txt" ]; then
    echo "transcript difference (linux, windows):"
    diff -u "$out/linux.txt" "$out/windows.txt" | head -60
fi
exit "$status"
