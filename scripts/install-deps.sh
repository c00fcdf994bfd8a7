#!/bin/sh
# Installs the Debian packages of the named sets that are missing, through sudo when not root.
# Usage: install-deps.sh SET...   sets: build run test bench powerpc package docs check
set -eu

packages_of() {
    case "$1" in
    build) echo g++ cmake ninja-build pkg-config libsqlite3-dev sqlite3 libjsoncpp-dev \
        libcurl4-openssl-dev libutf8proc-dev libre2-dev libcli11-dev libxxhash-dev libzstd-dev ;;
    run) echo syslog-ng-core syslog-ng-mod-sql libdbd-sqlite3 bsdutils procps python3 python3-aiosmtpd ;;
    test) echo libgtest-dev openssl ;;
    bench) echo libbenchmark-dev ;;
    powerpc) echo g++-powerpc-linux-gnu qemu-user dpkg-dev make tcl perl python3 unicode-data ;;
    package) echo dpkg-dev file debootstrap lintian ;;
    docs) echo doxygen mandoc ;;
    check) echo clang-14 clang-format-14 clang-tidy-14 libclang-rt-14-dev git ;;
    *) echo "install-deps.sh: unknown set '$1'; use build, run, test, bench, powerpc, package, docs or check" >&2; return 1 ;;
    esac
}

missing=
for set in "$@"; do
    for package in $(packages_of "$set"); do
        dpkg-query -W -f '${Status}' "$package" 2> /dev/null | grep -q 'ok installed' || missing="$missing $package"
    done
done
[ -n "$missing" ] || exit 0

as_root=
if [ "$(id -u)" -ne 0 ]; then
    command -v sudo > /dev/null || {
        echo "install-deps.sh: needs root to install:$missing; install sudo or run as root" >&2
        exit 1
    }
    as_root=sudo
fi
echo "Installing:$missing"
$as_root apt-get update -qq
# shellcheck disable=SC2086  # a list of words
$as_root env DEBIAN_FRONTEND=noninteractive apt-get install -y -qq --no-install-recommends $missing > /dev/null
