#!/bin/sh
# Lints the manual pages and builds the interface's HTML; warnings are failures.
# Usage: check-docs.sh FOLDER
set -eu
cd "$(dirname "$0")/.."
# Pages of other packages may be absent here.
if mandoc -T lint -W warning docs/man/* | grep -v 'referenced manual not found'; then
    exit 1
fi
mkdir -p "$1"
(cat docs/Doxyfile && echo "OUTPUT_DIRECTORY = $1") | doxygen -
