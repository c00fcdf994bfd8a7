#!/usr/bin/env bash
# Runs every fuzz target over its corpus and then on new inputs for a time each.
# Usage: fuzz.sh BUILD_FOLDER [SECONDS [SEED]]
# 0 seconds: the corpus only. The same seed tries the same inputs again; 0 tries others. Inputs that fail are kept in
# BUILD_FOLDER/fuzz.
set -euo pipefail
cd "$(dirname "$0")/.."

build=$(cd "$1" && pwd)
seconds=${2:-60}
seed=${3:-0}
status=0
for program in "$build"/fuzz/fuzz_*; do
    [ -x "$program" ] && [ -f "$program" ] || continue
    target=${program##*/fuzz_}
    corpus=fuzz/corpus/$target
    mkdir -p "$corpus" "$build/fuzz/found/$target"
    options=(-timeout=20 -rss_limit_mb=2048 -artifact_prefix="$build/fuzz/$target-" -print_final_stats=1 -seed="$seed")
    if [ "$seconds" -gt 0 ]; then
        options+=(-max_total_time="$seconds" -max_len=16384)
        folders=("$build/fuzz/found/$target" "$corpus")
    else
        options+=(-runs=0)
        folders=("$corpus")
    fi
    if "$program" "${options[@]}" "${folders[@]}" > "$build/fuzz/$target.log" 2>&1; then
        echo "$target: $(grep -o 'number_of_executed_units: [0-9]*' "$build/fuzz/$target.log" | grep -o '[0-9]*') inputs"
    else
        echo "$target: FAILED, see $build/fuzz/$target.log" >&2
        tail -n 30 "$build/fuzz/$target.log" >&2
        status=1
    fi
done
exit $status
