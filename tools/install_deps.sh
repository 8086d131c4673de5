#!/bin/sh
# Installs what building and testing need on a Debian machine, when run as root
# and something is missing. Without root it only says what is missing.
set -eu
packages="cmake g++ make pkg-config libgtest-dev libbenchmark-dev liblcms2-dev liblcms2-utils argyll icc-profiles-free colord-data libgs-common"
missing=""
for p in $packages; do
    dpkg-query -W -f='${Status}' "$p" 2>/dev/null | grep -q "install ok installed" || missing="$missing $p"
done
[ -z "$missing" ] && exit 0
if [ "$(id -u)" -eq 0 ]; then
    echo "install_deps: installing$missing"
    export DEBIAN_FRONTEND=noninteractive
    apt-get update -qq
    apt-get install -y -qq $missing >/dev/null
else
    echo "install_deps: missing$missing (run as root to install them)" >&2
fi
