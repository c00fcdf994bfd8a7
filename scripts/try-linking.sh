#!/bin/sh
# Builds the other two ways of linking: static libraries, and platform libraries that are not the bundled ones (made
# here from the static one). Usage: try-linking.sh FOLDER
set -eu
cd "$(dirname "$0")/.."
folder=$(mkdir -p "$1" && cd "$1" && pwd)
configure() {
    build=$1
    shift
    cmake -S . -B "$folder/$build" -G Ninja -DCMAKE_BUILD_TYPE=Release -DQUOR_BUILD_TESTS=OFF "$@" > /dev/null
}

configure static -DBUILD_SHARED_LIBS=OFF
cmake --build "$folder/static" -j 2
cmake --install "$folder/static" --prefix "$folder/static-root" > /dev/null
cmake -S tests/package/user -B "$folder/static-user" -G Ninja -DCMAKE_PREFIX_PATH="$folder/static-root" > /dev/null
cmake --build "$folder/static-user"

mkdir -p "$folder/libraries"
g++ -shared -Wl,-soname,libquordb.so -Wl,--whole-archive "$folder/static/platform/libquorplatform.a" \
    -Wl,--no-whole-archive -lsqlite3 -lzstd -lxxhash -o "$folder/libraries/libquordb.so"
for library in quorcore quornotify; do
    echo | g++ -shared -x c++ - -Wl,-soname,lib$library.so -o "$folder/libraries/lib$library.so"
done
configure system -DQUOR_PLATFORM=system -DQUOR_PLATFORM_FOLDER="$folder/libraries"
cmake --build "$folder/system" -j 2
readelf -d "$folder/system/libquorsyslog.so" | grep -q 'NEEDED.*libquordb.so'
LD_LIBRARY_PATH=$folder/libraries "$folder/system/tools/quorlog/quorlog" search --db /dev/null/none 2> "$folder/error" && exit 1
cat "$folder/error"
