#!/bin/sh
# Builds what the PowerPC build links, from Debian's source packages: SQLite, JsonCpp, RE2, utf8proc, zstd, xxHash, libcurl (with OpenSSL inside)
# and GoogleTest, and copies the headers of CLI11. The sources come from where this machine gets its packages.
# Usage: build-powerpc-deps.sh FOLDER       result: FOLDER/prefix; nothing is done when this script has completed it
set -eu
cd "$(dirname "$0")/.."
toolchain=$PWD/cmake/powerpc.toolchain.cmake
complete=complete-$(cat scripts/build-powerpc-deps.sh "$toolchain" | sha256sum | cut -c 1-16)
mkdir -p "$1/apt/lists"
cd "$1"
folder=$PWD
prefix=$folder/prefix
host=powerpc-linux-gnu
jobs=$(nproc)

[ -e "$complete" ] && exit 0
rm -rf "$prefix" complete*

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

# The newest version whose source is there: a mirror may know of one that it does not have yet.
fetch_package() {
    for version in $(apt-cache madison "$1" | cut -d '|' -f 2 | sort -ruV); do
        apt-get source -qq --only-source "$1=$version" >> fetch.log 2>&1 && return
    done
    echo "build-powerpc-deps.sh: no source of $1 can be fetched:" >&2
    cat fetch.log >&2
    return 1
}

fetch() {
    export APT_CONFIG=$folder/apt/apt.conf
    apt-get update -qq
    rm -rf src
    mkdir src
    cd src
    for package in "$@"; do fetch_package "$package"; done
    cd ..
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

# What TLS needs and nothing else, to be linked into libcurl.
build_openssl() {
    cd "$folder"/src/openssl-*
    ./Configure linux-ppc --cross-compile-prefix="$(command -v ccache || true) $host-" --prefix="$prefix" --libdir=lib --openssldir=/etc/ssl \
        -fPIC no-shared no-tests no-module no-engine no-legacy no-cms no-ts no-cmp no-srp no-psk no-idea no-seed no-aria no-camellia \
        no-bf no-cast no-rc2 no-rc4 no-md2 no-md4 no-rmd160 no-whirlpool no-sm2 no-sm3 no-sm4 no-dtls no-ssl3 no-comp no-ocb \
        no-siphash no-blake2 no-gost no-ct no-rfc3779 > configure.log
    make -j"$jobs" build_libs > build.log 2>&1 || {
        tail build.log >&2
        exit 1
    }
    make install_dev > install.log
}

# Its symbols have no versions, so that the programs run with any libcurl.so.4, Debian's too.
build_curl() {
    build_with_cmake "$(echo "$folder"/src/curl-*/)" -DBUILD_CURL_EXE=OFF -DBUILD_TESTING=OFF -DENABLE_MANUAL=OFF \
        -DCMAKE_SHARED_LINKER_FLAGS=-Wl,--exclude-libs,ALL,--no-undefined -DCMAKE_C_STANDARD_LIBRARIES=-l:libatomic.a \
        -DCURL_USE_OPENSSL=ON -DOPENSSL_USE_STATIC_LIBS=ON \
        -DCURL_CA_BUNDLE=/etc/ssl/certs/ca-certificates.crt -DCURL_CA_PATH=none -DCURL_USE_LIBSSH2=OFF -DCURL_USE_LIBPSL=OFF \
        -DUSE_LIBIDN2=OFF -DUSE_NGHTTP2=OFF -DCURL_ZLIB=OFF -DCURL_BROTLI=OFF -DCURL_ZSTD=OFF \
        $(printf -- '-DCURL_DISABLE_%s=ON ' DICT FILE FTP GOPHER IMAP LDAP LDAPS MQTT POP3 RTSP SMB TELNET TFTP NTLM)
}

write_sources
fetch sqlite3 libjsoncpp utf8proc re2 libzstd xxhash openssl curl
(build_sqlite)
build_re2
(build_openssl)
build_curl
build_with_cmake "$(echo "$folder"/src/libjsoncpp-*/)" -DBUILD_SHARED_LIBS=ON -DBUILD_STATIC_LIBS=OFF \
    -DBUILD_OBJECT_LIBS=OFF -DJSONCPP_WITH_TESTS=OFF -DJSONCPP_WITH_POST_BUILD_UNITTEST=OFF
build_with_cmake "$(echo "$folder"/src/utf8proc-*/)" -DBUILD_SHARED_LIBS=ON
build_with_cmake "$(echo "$folder"/src/libzstd-*/build/cmake/)" -DZSTD_BUILD_PROGRAMS=OFF -DZSTD_BUILD_STATIC=OFF
build_with_cmake "$(echo "$folder"/src/xxhash-*/cmake_unofficial/)" -DXXHASH_BUILD_XXHSUM=OFF
build_with_cmake /usr/src/googletest
mkdir -p "$prefix/share/cmake"
cp -R /usr/include/CLI "$prefix/include/"
cp -R /usr/share/cmake/CLI11 "$prefix/share/cmake/"
rm -rf src
touch "$complete"
