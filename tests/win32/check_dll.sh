#!/bin/sh
# Reads the export table, imports and resources of vantrel.dll with objdump:
#   - a 32-bit PE DLL named vantrel.dll,
#   - exactly the fourteen functions under their plain names with their fixed ordinals,
#   - imports from system DLLs only (the C++ runtime is linked in),
#   - the four identity profiles as resources of type ICCPROFILE, ids 102 to 105.
# Exits 77 (skipped) when the DLL or objdump is missing.
set -u
dll=${1:?usage: check_dll.sh path/to/vantrel.dll}
objdump=$(command -v i686-w64-mingw32-objdump || command -v x86_64-w64-mingw32-objdump || true)
if [ ! -f "$dll" ]; then
    echo "SKIPPED: $dll not built (make windows)"
    exit 77
fi
if [ -z "$objdump" ]; then
    echo "SKIPPED: no MinGW objdump to read $dll"
    exit 77
fi
dump=$(mktemp)
trap 'rm -f "$dump"' EXIT
"$objdump" -p "$dll" >"$dump" || { echo "FAILED: objdump cannot read $dll"; exit 1; }

failed=0
fail() { echo "FAILED: $*"; failed=1; }

grep -q '^Magic.*(PE32)$' "$dump" || fail "not a 32-bit PE image"
grep -Eq '^Name[[:space:]]+[0-9a-f]+ vantrel\.dll$' "$dump" || fail "export directory does not name vantrel.dll"
grep -Eq '^Ordinal Base[[:space:]]+1$' "$dump" || fail "ordinal base is not 1"

# "[Ordinal/Name Pointer] Table" lists each name with its ordinal less the base.
want="1 dllInit
2 dllFree
3 analyse1
4 optimize1
5 analyse2
6 optimize2
7 analyse3
8 optimize3
9 Cmyk2Lab_Double
10 analyse4
11 Cmykrgb2Lab_Double
12 optimize4
13 RGB2Lab_Double
14 mergeMCHintoCMYK"
have=$(awk '/^\[Ordinal\/Name Pointer\] Table/ { on = 1; next }
            on && /^[[:space:]]*\[ *[0-9]+\]/ { gsub(/[][]/, " "); print $1 + 1, $2; next }
            on { on = 0 }' "$dump" | sort -n)
if [ "$have" != "$want" ]; then
    fail "exports differ from the fixed ordinals"
    printf 'want:\n%s\nhave:\n%s\n' "$want" "$have"
fi
count=$(awk '/Export Address Table[[:space:]]+[0-9a-f]+$/ { print $NF; exit }' "$dump")
[ "$(printf '%d' "0x${count:-0}")" = 14 ] || fail "export address table holds $count entries, not 14"

# A Windows machine has these; MinGW's own runtime DLLs (libstdc++-6, libgcc_s, libwinpthread-1) it lacks.
imports=$(awk '/DLL Name:/ { print tolower($3) }' "$dump" | sort -u)
for dll_name in $imports; do
    case $dll_name in
        kernel32.dll | msvcrt.dll | user32.dll | advapi32.dll) ;;
        *) fail "imports $dll_name, which a Windows machine lacks" ;;
    esac
done

# The resource tree is printed indented by level: type, then id, then language.
resources=$(awk '/^The \.rsrc Resource Directory section/ { on = 1; next }
                 !on || !/Entry: / { next }
                 { level = index($0, "Entry: ") }
                 /Entry: name: .*ICCPROFILE,/ { type = level; next }
                 level <= type { type = 0 }
                 type && level == type + 2 && /Entry: ID: / { sub(/,.*/, ""); print $NF }' "$dump" |
            while read -r id; do printf '%d ' "$id"; done)
[ "$resources" = "102 103 104 105 " ] || fail "ICCPROFILE resources are [$resources], not 102 to 105"

if [ "$failed" -eq 0 ]; then
    echo "vantrel.dll: PE32, fourteen exports with their ordinals, system imports only ($(echo $imports)), ICCPROFILE 102-105"
fi
exit "$failed"
