#!/bin/sh
# Configures and builds one preset of CMakePresets.json.
set -eu
cd "$(dirname "$0")/.."
cmake --preset "$1" > /dev/null
cmake --build --preset "$1"
