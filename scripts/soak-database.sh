#!/usr/bin/env bash
# The real syslog-ng writes 1,000 messages a second while eight searchers, a deleter and a checkpointer use its
# database. Afterwards every message must have got its row, and the database must be sound.
# Usage: soak-database.sh BUILD_FOLDER [SECONDS [ROWS_KEPT]]
set -euo pipefail
cd "$(dirname "$0")/.."
. scripts/receive.sh

build=$(cd "$1" && pwd)
seconds=${2:-600}
port=${QUOR_SOAK_PORT:-15644}
folder=$(mktemp -d /tmp/quor-soak-XXXXXX)
db=$folder/syslog.db
syslog_ng=

fail() {
    echo "soak-database.sh: $*" >&2
    exit 1
}
stop() { [ -z "$syslog_ng" ] || { kill "$syslog_ng" 2> /dev/null || true; wait "$syslog_ng" 2> /dev/null || true; }; syslog_ng=; }
finish() {
    stop
    [ -n "${KEEP:-}" ] || rm -rf "$folder"
}
trap finish EXIT

start_syslog_ng "$folder" "$port" "$db" "cat > /dev/null"

rows() { sqlite3 "$db" 'PRAGMA busy_timeout=5000' "$1" 2> /dev/null | tail -n 1; }
sent=$((seconds * 1000))
loggen --inet --stream --rate 1000 --size 200 --number "$sent" --interval $((seconds * 2 + 10)) --quiet \
    127.0.0.1 "$port" > "$folder/loggen.log" 2>&1 &
sender=$!
for _ in $(seq 100); do [ "$(rows 'SELECT max(id) > 0 FROM logs')" = 1 ] && break; sleep 0.1; done

status=0
"$build/bench/soak/soak" "$db" "$seconds" "${3:-100000}" || status=1
wait "$sender" || true
sent=$(grep -o 'count=[0-9]*' "$folder/loggen.log" | grep -o '[0-9]*')  # it may send a few more than asked for
for _ in $(seq 100); do [ "$(rows 'SELECT max(id) FROM logs')" = "$sent" ] && break; sleep 0.1; done
log_size=$(stat -c %s "$db-wal" 2> /dev/null || echo 0)
stop

# Ids count the rows that were written; the deleter takes the oldest, so those that are left have no gap.
read -r oldest newest left different <<< "$(sqlite3 -separator ' ' "$db" \
    'SELECT min(id), max(id), count(*), count(DISTINCT substr(msg, 1, 16)) FROM logs')"
echo "messages sent: $sent, written: $newest, left: $left from $oldest on, write-ahead log at the end: $log_size bytes"
echo "lines of syslog-ng about errors: $(grep -ci -e error -e busy -e locked "$folder/syslog-ng.log" || true)"
grep -i -e error -e busy -e locked "$folder/syslog-ng.log" | head -n 3 || true
[ "$newest" = "$sent" ] || { echo "soak-database.sh: rows were lost or written twice" >&2; status=1; }
[ "$different" = "$left" ] || { echo "soak-database.sh: rows were written twice" >&2; status=1; }
[ $((newest - oldest + 1)) = "$left" ] || { echo "soak-database.sh: rows between others are missing" >&2; status=1; }
[ "$(sqlite3 "$db" 'PRAGMA integrity_check')" = ok ] || { echo "soak-database.sh: the database is damaged" >&2; status=1; }
exit $status
