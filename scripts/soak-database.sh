#!/usr/bin/env bash
# The real syslog-ng writes 1,000 messages a second, and a burst of 20,000 now and then, while eight searchers, a deleter
# and a checkpointer use its database, and quorlogd, which follows it, is killed again and again. Afterwards every message
# must have got its row and have been counted once, and the databases must be sound.
# Usage: soak-database.sh BUILD_FOLDER [SECONDS [ROWS_KEPT]]
set -euo pipefail
cd "$(dirname "$0")/.."
. scripts/receive.sh

build=$(cd "$1" && pwd)
seconds=${2:-600}
port=${QUOR_SOAK_PORT:-15644}
folder=$(mktemp -d /tmp/quor-soak-XXXXXX)
db=$folder/syslog.db
accounting=$build/root/var/log/quorlog/.QUORACCOUNTDB
burst=20000
number=$build/root/run/quorlogd.pid
syslog_ng=
quorlogd=
disturber=
status=0

fail() {
    echo "soak-database.sh: $*" >&2
    status=1
}
finish() {
    end TERM "$disturber" "$syslog_ng"
    end TERM "$(cat "$number" 2> /dev/null)"
    [ -n "${KEEP:-}" ] || rm -rf "$folder"
}
trap finish EXIT

ask() { sqlite3 -readonly "$1" '.timeout 5000' "$2" 2> /dev/null; }
send() { python3 scripts/send-numbered.py "$port" "$@" >> "$folder/sent"; }
has_rows() { [ "$(ask "$db" 'SELECT max(id) > 0 FROM logs')" = 1 ]; }
sent() { awk '{ sum += $1 } END { print sum + 0 }' "$folder/sent"; }
all_stored() { [ "$(ask "$db" 'SELECT max(id) FROM logs')" -ge "$(sent)" ]; }
counted() { ask "$accounting" 'SELECT sum(count) FROM histogram'; }
all_counted() {
    kill -USR2 "$quorlogd"
    [ "$(counted)" = "$(ask "$db" 'SELECT max(id) FROM logs')" ]
}
keep_following() {
    while sleep $((RANDOM % 12 + 8)); do
        end KILL "$quorlogd"
        start_quorlogd "$build" "$db"
    done
}

rm -rf "$build/root/var/log/quorlog" "$build/root/usr/quor/etc"
mkdir -p "$build/root/var/log/quorlog" "$build/root/usr/quor/etc"
start_syslog_ng "$folder" "$port" "$db"
rm -f "$number"
keep_following &
disturber=$!
send steady $((seconds * 1000)) 1 1000 &
steady=$!
await "the first message" has_rows
for ((i = 0; i < seconds / 20; i++)); do
    sleep 20
    send "burst-$i" "$burst" 10
done &
bursts=$!
"$build/bench/soak/soak" "$db" "$seconds" "${3:-100000}" || status=1
wait "$steady" "$bursts"
await "the last message" all_stored
log_size=$(stat -c %s "$db-wal" 2> /dev/null || echo 0)
end KILL "$disturber"
end KILL "$(cat "$number")"
sleep 1 # it is no child of this script, which could wait for it
start_quorlogd "$build" "$db"
await "the last count" all_counted
end TERM "$syslog_ng" "$quorlogd"

# Ids count the rows that were written; the deleter takes the oldest, so those that are left have no gap.
read -r oldest newest left different <<< "$(sqlite3 -separator ' ' "$db" \
    'SELECT min(id), max(id), count(*), count(DISTINCT prog || substr(msg, 1, 16)) FROM logs')"
echo "messages sent: $(sent), written: $newest, counted: $(counted), left: $left from $oldest on, write-ahead log at the end: $log_size bytes"
echo "lines of syslog-ng about errors: $(grep -ci -e error -e busy -e locked "$syslog_ng_log" || true)"
grep -i -e error -e busy -e locked "$syslog_ng_log" | head -n 3 || true
[ "$newest" = "$(sent)" ] || fail "rows were lost or written twice"
[ "$(counted)" = "$newest" ] || fail "rows were not counted, or twice"
[ "$different" = "$left" ] || fail "rows were written twice"
[ $((newest - oldest + 1)) = "$left" ] || fail "rows between others are missing"
[ "$(sqlite3 "$db" 'PRAGMA integrity_check')" = ok ] || fail "the database is damaged"
exit $status
