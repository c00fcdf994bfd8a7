#!/bin/sh
# Builds the packages of one release preset, the .deb files and a tarball, in build/packages, and has lintian check them.
# Usage: package.sh PRESET
set -eu
cd "$(dirname "$0")/.."
scripts/build.sh "$1"
for kind in DEB TGZ; do
    (cd "build/$1" && cpack -G "$kind" > cpack.log 2>&1) || {
        cat "build/$1/cpack.log" >&2
        exit 1
    }
done
rm -rf build/packages/_CPack_Packages
architecture=$(sed -n 's/^set(CPACK_DEBIAN_PACKAGE_ARCHITECTURE "\(.*\)")/\1/p' "build/$1/CPackConfig.cmake")
lintian --allow-root --fail-on error build/packages/*_"$architecture".deb
