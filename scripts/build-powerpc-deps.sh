#!/bin/sh
# Builds what the PowerPC build links, from Debian's source packages: SQLite, JsonCpp, RE2, utf8proc and GoogleTest, and copies the
# headers of CLI11. The sources come from where this machine gets its packages.
# Usage: build-powerpc-deps.sh FOLDER       result: FOLDER/prefix; nothing is done when it is complete
set -eu
cd "$(dirname "$0")/.."
toolchain=$PWD/cmake/powerpc.toolchain.cmake
mkdir -p "$1/apt/lists" "$1/src"
cd "$1"
folder=$PWD
prefix=$folder/prefix
host=powerpc-linux-gnu
jobs=$(nproc)

[ -e "$folder/complete" ] && exit 0

# Debian's own repositories among the machine's package sources, as source entries.
write_sources() {
    apt-get indextargets --format 'deb-src $(REPO_URI) $(RELEASE) $(COMPONENT)' \
        'Created-By: Packages' 'Origin: Debian' | sort -u > apt/sources.list
    [ -s apt/sources.list ] || {
        echo "build-powerpc-deps.sh: no Debian package source is configured; run apt-get update and try again" >&2
        exit 1
    }
    cat > apt/apt.conf << END
Dir::Etc::sourcelist "$folder/apt/sources.list";
Dir::Etc::sourceparts "-";
Dir::State::lists "$folder/apt/lists";
Dir::Cache::pkgcache "";
Dir::Cache::srcpkgcache "";
APT::Sandbox::User "root";
END
}

fetch() {
    export APT_CONFIG=$folder/apt/apt.conf
    apt-get update -qq
    (cd src && rm -rf ./* && apt-get source -qq --only-source "$@" > fetch.log 2>&1) || {
        cat src/fetch.log >&2
        exit 1
    }
}

# With the options of Debian's own package.
build_sqlite() {
    cd "$folder"/src/sqlite3-*
    options=$(grep -o -e '-DSQLITE_[A-Z0-9_]*\(=[0-9]*\)\?' debian/rules | tr '\n' ' ')
    ./configure --build="$(dpkg-architecture -qDEB_BUILD_GNU_TYPE)" --host=$host --prefix="$prefix" \
        --enable-threadsafe --disable-static --disable-tcl --disable-readline CFLAGS="-O2 -fno-strict-aliasing $options" > configure.log
    make -j"$jobs" BCC=gcc CROSS_BUILDING=yes libsqlite3.la > build.log
    make BCC=gcc CROSS_BUILDING=yes lib_install > install.log
    install -D -m 644 sqlite3.h "$prefix/include/sqlite3.h"
    install -D -m 644 sqlite3.pc "$prefix/lib/pkgconfig/sqlite3.pc"
}

build_re2() {
    make -C "$folder"/src/re2-* -j"$jobs" CXX=$host-g++ CXXFLAGS=-O2 REBUILD_TABLES=1 prefix="$prefix" \
        shared-install > "$folder/src/re2.log"
}

# build_with_cmake SOURCE [OPTION...]
build_with_cmake() {
    source=$1
    shift
    build=$folder/src/build-$(basename "$source")
    cmake -S "$source" -B "$build" -G Ninja -DCMAKE_TOOLCHAIN_FILE="$toolchain" -DQUOR_TARGET_PREFIX="$prefix" \
        -DCMAKE_INSTALL_PREFIX="$prefix" -DCMAKE_INSTALL_LIBDIR=lib -DCMAKE_BUILD_TYPE=Release "$@" > /dev/null
    cmake --build "$build" -j "$jobs" > /dev/null
    cmake --install "$build" > /dev/null
}

write_sources
fetch sqlite3 libjsoncpp utf8proc re2
(build_sqlite)
build_re2
build_with_cmake "$(echo "$folder"/src/libjsoncpp-*/)" -DBUILD_SHARED_LIBS=ON -DBUILD_STATIC_LIBS=OFF \
    -DBUILD_OBJECT_LIBS=OFF -DJSONCPP_WITH_TESTS=OFF -DJSONCPP_WITH_POST_BUILD_UNITTEST=OFF
build_with_cmake "$(echo "$folder"/src/utf8proc-*/)" -DBUILD_SHARED_LIBS=ON
build_with_cmake /usr/src/googletest
mkdir -p "$prefix/share/cmake"
cp -R /usr/include/CLI "$prefix/include/"
cp -R /usr/share/cmake/CLI11 "$prefix/share/cmake/"
rm -rf src
touch complete
