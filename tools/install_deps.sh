#!/bin/sh
# Installs what building and testing need on a Debian machine, when run as root
# and something is missing. Without root it only says what is missing.
set -eu
# python3 runs the command-line tests, chromium renders their proof report.
packages="cmake g++ make pkg-config libgtest-dev libbenchmark-dev liblcms2-dev liblcms2-utils argyll icc-profiles-free colord-data libgs-common python3 chromium"
# make demo needs only the compiler, CMake, Argyll and the FOGRA data (install_deps.sh --demo).
demo_only=""
if [ "${1:-}" = "--demo" ]; then
    packages="cmake g++ make argyll icc-profiles-free"
    demo_only=1
fi
# The Windows build (MinGW-w64) and its Wine run; without them those steps skip.
windows_packages="g++-mingw-w64-i686-posix binutils-mingw-w64-i686 wine wine64 wine32:i386"

is_root() { [ "$(id -u)" -eq 0 ]; }

installed() {
    dpkg-query -W -f='${Status}' "$1" 2>/dev/null | grep -q "install ok installed"
}

missing_of() {
    missing=""
    for p in "$@"; do
        installed "$p" || missing="$missing $p"
    done
    echo "$missing"
}

apt_updated=""
apt_update() {
    if [ -z "$apt_updated" ]; then
        apt-get update -qq
        apt_updated=1
    fi
}
apt_install() {
    export DEBIAN_FRONTEND=noninteractive
    apt_update
    apt-get install -y -qq "$@" >/dev/null
}

# Some kernels (this project's CI machines among them) run no 32-bit x86 programs, and
# Wine's 32-bit half is one. qemu then runs them, registered with binfmt_misc. qemu before
# version 8 keeps a flag per guest page and needs over a minute to start a Wine process;
# where the release's own qemu is that old, its backports have a current one.
setup_i386_emulation() {
    qemu_major() { v=${1#*:}; echo "${v%%.*}"; }
    have=$(dpkg-query -W -f='${Version}' qemu-user-static 2>/dev/null || true)
    if [ -z "$have" ] || [ "$(qemu_major "$have")" -lt 8 ]; then
        apt_update
        release=""
        wanted=$(apt-cache policy qemu-user-static | awk '/Candidate:/ { print $2 }')
        codename=$(. /etc/os-release && echo "${VERSION_CODENAME:-}")
        if [ "$(qemu_major "${wanted:-0}")" -lt 8 ] && [ -n "$codename" ]; then
            if ! grep -rqs "$codename-backports" /etc/apt/sources.list /etc/apt/sources.list.d/; then
                printf 'Types: deb\nURIs: http://deb.debian.org/debian\nSuites: %s-backports\nComponents: main\nSigned-By: /usr/share/keyrings/debian-archive-keyring.gpg\n' \
                    "$codename" >"/etc/apt/sources.list.d/$codename-backports.sources"
                apt_updated=""
                apt_update
            fi
            release="-t $codename-backports"
        fi
        # shellcheck disable=SC2086
        apt_install --no-install-recommends $release qemu-user-static ||
            apt_install --no-install-recommends qemu-user-static || return 1
    fi
    [ -x /usr/bin/qemu-i386-static ] || return 1
    binfmt=/proc/sys/fs/binfmt_misc
    [ -f "$binfmt/register" ] || mount -t binfmt_misc binfmt_misc "$binfmt" || return 1
    if [ -f "$binfmt/qemu-i386" ]; then echo -1 >"$binfmt/qemu-i386"; fi
    # ELF, 32-bit, little-endian, executable or shared object, machine i386. F: the kernel
    # opens qemu now, so the registration holds inside any mount namespace.
    printf '%s' ':qemu-i386:M::\x7fELF\x01\x01\x01\x00\x00\x00\x00\x00\x00\x00\x00\x00\x02\x00\x03\x00:\xff\xff\xff\xff\xff\xfe\xfe\x00\xff\xff\xff\xff\xff\xff\xff\xff\xfe\xff\xff\xff:'"$(readlink -f /usr/bin/qemu-i386-static)"':F' \
        >"$binfmt/register" || return 1
    /usr/lib/wine/wine --version >/dev/null 2>&1
}

missing=$(missing_of $packages)
if [ -n "$missing" ]; then
    if is_root; then
        echo "install_deps: installing$missing"
        apt_install $missing
    else
        echo "install_deps: missing$missing (run as root to install them)" >&2
    fi
fi

[ -n "$demo_only" ] && exit 0

# The Windows part never stops the Linux build and tests: what fails here makes the
# Windows steps say that they skip.
missing=$(missing_of $windows_packages)
if [ -n "$missing" ]; then
    if is_root; then
        echo "install_deps: installing$missing"
        if ! dpkg --print-foreign-architectures | grep -qx i386; then
            dpkg --add-architecture i386
            apt_updated=""
        fi
        apt_install $missing || echo "install_deps: could not install$missing; the Windows build and its Wine test will skip" >&2
    else
        echo "install_deps: missing$missing (the Windows build and its Wine test skip; run as root to install them)" >&2
    fi
fi
if [ -x /usr/lib/wine/wine ] && ! /usr/lib/wine/wine --version >/dev/null 2>&1; then
    if is_root; then
        echo "install_deps: this kernel runs no 32-bit programs; registering qemu to run them"
        setup_i386_emulation || echo "install_deps: could not set up qemu for 32-bit programs; the Wine test will skip" >&2
    else
        echo "install_deps: this kernel runs no 32-bit programs (the Wine test skips; run as root to set up qemu)" >&2
    fi
fi
exit 0
