#!/usr/bin/env python3
"""Prints the medians of a benchmark run: each of ours beside its rivals, as a ratio of processor time."""
import json
import sys

# ours, rival, target: at most that many times the rival ("<="), or at least that many times faster (">=")
PAIRS = [
    ("page/ours/200000", "page/hand/200000", "<=", 1.3),
    ("page/ours/2000000", "page/hand/2000000", "<=", 1.3),
    ("page/ours/10000000", "page/hand/10000000", "<=", 1.3),
    ("page/ours/10000000", "page/ours/200000", "<=", 1.1),
    ("page/ours/2000000", "page/offset-plain-table/2000000", ">=", 300),
    ("page/ours/2000000", "page/offset/2000000", ">=", 1),
    ("count/ours/200000", "count/hand/200000", "<=", 1.3),
    ("count/ours/2000000", "count/hand/2000000", "<=", 1.3),
    ("count/ours/2000000", "count/ours/200000", "<=", 1.1),
    ("all/ours/200000", "all/fastest-loop/200000", "<=", 1.5),
    ("all/ours/2000000", "all/fastest-loop/2000000", "<=", 1.5),
    ("all/fastest-loop/200000", "all/usual-loop/200000", "<=", 1.0),
    ("all/ours/200000", "all/get-table/200000", ">=", 3),
    ("keyword/ours", "keyword/plain-table", ">=", 1.3),
    ("host-common/ours", "host-common/plain-table", ">=", 1),
    ("two-hosts/ours", "two-hosts/plain-table", ">=", 1),
    ("days/ours", "days/plain-table", ">=", 1),
]
MILLISECONDS = [
    ("host-rare/ours", 5), ("host-absent/ours", 5), ("prog-rare/ours", 5), ("prog-absent/ours", 5),
    ("names/distinct", 5), ("values/ours", 120),
]


def verdict(good):
    return "" if good else "  <-- missed"


with open(sys.argv[1], encoding="utf-8") as file:
    runs = json.load(file)["benchmarks"]
medians = {run["run_name"]: run["cpu_time"] for run in runs if run.get("aggregate_name") == "median"}

for ours, rival, kind, target in PAIRS:
    if ours not in medians or rival not in medians:
        continue
    mine, other = medians[ours], medians[rival]
    ratio = mine / other if kind == "<=" else other / mine
    good = ratio <= target if kind == "<=" else ratio >= target
    word = "times" if kind == "<=" else "times faster than"
    print(f"{ours:26} {mine:12.0f} us   {ratio:8.2f} {word:18} {rival:26} {kind} {target}{verdict(good)}")
for name, target in MILLISECONDS:
    taken = medians[name] / 1000
    print(f"{name:26} {taken:12.2f} ms   <= {target}{verdict(taken <= target)}")
