#!/bin/sh
# Builds the test profiles from the FOGRA and TR characterisation data of
# icc-profiles-free with Argyll's colprof, once: later runs find them cached.
#   make_fixtures.sh DIR
set -eu
dir=${1:?usage: make_fixtures.sh DIR}
data=/usr/share/color/icc
mkdir -p "$dir"

build() {  # name quality
    name=$1 quality=$2
    [ -s "$dir/$name.icc" ] && return 0
    if ! command -v colprof >/dev/null 2>&1 || [ ! -f "$data/$name.ti3" ]; then
        echo "make_fixtures: colprof or $data/$name.ti3 missing; tests needing $name.icc will skip" >&2
        return 0
    fi
    work=$(mktemp -d)
    cp "$data/$name.ti3" "$work/"
    (cd "$work" && colprof -q"$quality" -D "$name test profile" "$name" >/dev/null)
    mv "$work/$name.icc" "$dir/$name.icc.tmp" && mv "$dir/$name.icc.tmp" "$dir/$name.icc"
    rm -rf "$work"
    echo "make_fixtures: built $dir/$name.icc"
}

build FOGRA39L m
build TR003 l
