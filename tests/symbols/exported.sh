#!/bin/sh
# Compares the symbols that a library exports with a list.
# Usage: exported.sh NM LIBRARY LIST [--update]
set -eu
exported() {
    "$1" -DC --defined-only "$2" | cut -d ' ' -f 3- | LC_ALL=C sort -u |
        sed -e 's/std::__cxx11::basic_string<char, std::char_traits<char>, std::allocator<char> >/std::string/g' \
            -e 's/\[abi:cxx11\]//g' -e 's/std::__cxx11::/std::/g'
}
if [ "${4-}" = --update ]; then
    exported "$1" "$2" > "$3"
elif ! exported "$1" "$2" | diff "$3" -; then
    echo "The exported symbols changed ('<' lost, '>' new). If that is meant: $0 $1 $2 $3 --update" >&2
    exit 1
fi
