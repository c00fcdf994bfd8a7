#!/bin/sh
# The table that syslog-ng created is the one that the schema file creates.
# Usage: same_table.sh DATABASE SCHEMA
set -eu
describe() {
    sqlite3 "$1" "SELECT name, type, hidden FROM pragma_table_xinfo('logs')" "SELECT * FROM sqlite_stat1" \
        "SELECT name FROM sqlite_schema WHERE type = 'index'" "PRAGMA page_size"
}
fresh=$(mktemp)
trap 'rm -f "$fresh"' EXIT
sqlite3 "$fresh" < "$2"
expected=$(describe "$fresh")
[ -n "$expected" ] && [ "$(describe "$1")" = "$expected" ]
