#!/bin/sh
# Runs clang-tidy over every file of a build folder's compile commands.
set -eu
cd "$(dirname "$0")/.."
python3 - "$1" <<'PYTHON' | xargs -P 2 -n 4 clang-tidy-14 --quiet -p "$1"
import json, sys
for entry in json.load(open(sys.argv[1] + "/compile_commands.json")):
    if entry["file"].endswith(".cpp"):
        print(entry["file"])
PYTHON
