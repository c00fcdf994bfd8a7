#!/bin/sh
# Runs every benchmark of a build folder and prints ours beside its rivals.
# Usage: run-bench.sh BUILD_FOLDER       QUOR_BENCH_ROWS=10000000 adds the largest table (4 GB, some minutes).
set -eu
cd "$(dirname "$0")/.."
results=$1/search.json

"$1/bench/receive/bench_receive"
"$1/bench/search/quor_bench" --benchmark_repetitions=5 --benchmark_min_time=0.05 \
    --benchmark_enable_random_interleaving=true --benchmark_report_aggregates_only=true \
    --benchmark_out="$results" --benchmark_out_format=json > "$1/search.txt"
grep '^memory/' "$1/search.txt"
python3 scripts/bench-ratios.py "$results"
