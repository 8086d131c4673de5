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

# A locale with a decimal comma, for the measurement-file writer: built from glibc's sources into
# the fixture directory (tests point LOCPATH at it), since build machines often have only C.UTF-8.
locale() {  # name
    name=$1
    [ -d "$dir/locale/$name.UTF-8" ] && return 0
    if ! command -v localedef >/dev/null 2>&1 || [ ! -f "/usr/share/i18n/locales/$name" ]; then
        echo "make_fixtures: localedef or the $name source missing; the decimal-comma test will skip" >&2
        return 0
    fi
    mkdir -p "$dir/locale"
    localedef -i "$name" -f UTF-8 "$dir/locale/$name.UTF-8.tmp" >/dev/null 2>&1 || true
    if [ -d "$dir/locale/$name.UTF-8.tmp" ]; then
        mv "$dir/locale/$name.UTF-8.tmp" "$dir/locale/$name.UTF-8"
        echo "make_fixtures: built $dir/locale/$name.UTF-8"
    fi
}

locale de_DE
