#!/bin/sh
# Usage: chain_test.sh SOURCE_FOLDER BUILD_FOLDER DATABASE
set -eu
"$1/scripts/run-demo.sh" "$2"

describe() {
    sqlite3 "$1" "SELECT name, type, hidden FROM pragma_table_xinfo('logs')" "SELECT * FROM sqlite_stat1" \
        "SELECT name FROM sqlite_schema WHERE type = 'index'" "PRAGMA page_size" \
        "SELECT id, length(value) FROM store_identity"
}
fresh=$(mktemp)
trap 'rm -f "$fresh"' EXIT
sqlite3 "$fresh" < "$1/schema/syslog.sql"
describe "$fresh" > "$fresh.expected"
describe "$3" | diff "$fresh.expected" -
rm "$fresh.expected"
