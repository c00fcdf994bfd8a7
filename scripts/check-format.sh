#!/bin/sh
# Fails when a source file is not formatted as .clang-format says; --fix formats it.
set -eu
cd "$(dirname "$0")/.."
mode="--dry-run --Werror"
[ "${1:-}" = --fix ] && mode=-i
# shellcheck disable=SC2086  # two words
git ls-files -co --exclude-standard '*.cpp' '*.h' '*.c' | xargs ls -d 2> /dev/null | xargs clang-format-14 $mode
