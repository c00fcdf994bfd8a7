#!/usr/bin/env bash
# Backups, restores, merges and compactions while messages arrive, some of them killed. At the end every message must be
# in the database once and counted once.
# Usage: try-recovery.sh BUILD_FOLDER [ROUNDS]     KEEP=1: leave the data for a look
set -euo pipefail
cd "$(dirname "$0")/.."
. scripts/receive.sh

build=$(cd "$1" && pwd)
rounds=${2:-3}
port=${QUOR_RECOVERY_PORT:-16114}
root=$build/root
db=$root/var/log/quorlog/syslog.db
accounting=$root/var/log/quorlog/.QUORACCOUNTDB
run=$(mktemp -d /tmp/quor-recovery-XXXXXX)
quorlog=$build/tools/quorlog/quorlog
filler=60000
numbered=$((rounds * 60000))
syslog_ng=
quorlogd=
patience=120

fail() {
    echo "try-recovery.sh: $*" >&2
    exit 1
}
finish() {
    end TERM "$syslog_ng"
    end TERM "$quorlogd"
    [ -n "${KEEP:-}" ] || rm -rf "$run"
}
trap finish EXIT

ask() { sqlite3 -readonly "$1" '.timeout 10000' "$2" 2> /dev/null; }
rows() { ask "$db" "SELECT count(*) FROM logs WHERE prog = '$1'"; }
different() { ask "$db" "SELECT count(DISTINCT msg) FROM logs WHERE prog = '$1'"; }
total() { ask "$accounting" 'SELECT ifnull(sum(count), 0) FROM histogram'; }
filled() { [ "$(rows filler)" = $filler ]; }
all_counted() { kill -USR2 "$quorlogd" && [ "$(total)" = $((filler + numbered)) ]; }
timed() {
    local begin
    begin=$(date +%s%N)
    "$@"
    echo "    $((($(date +%s%N) - begin) / 1000000)) ms: ${*:2:2}"
}
merge_all() {
    local aside
    for aside in "$db".before-restore-*; do
        case $aside in *-wal | *-shm) continue ;; esac
        [ ! -e "$aside" ] || timed "$quorlog" db merge "$aside" --into "$db"
    done
}
merge_killed() {
    local aside
    aside=$(ls -t "$db".before-restore-* | head -n 1)
    for _ in 1 2 3; do
        "$quorlog" db merge "$aside" --into "$db" > /dev/null &
        sleep "0.$((RANDOM % 9 + 1))"
        end KILL $!
    done
}

rm -rf "$root/var/log/quorlog" "$root/etc/quorsyslog" "$root/usr/quor/etc" "$root/run"
mkdir -p "$root/var/log/quorlog" "$root/etc/quorsyslog" "$root/usr/quor/etc" "$root/run"
start_syslog_ng "$run" "$port" "$db"
echo "$syslog_ng" > "$root/run/syslog-ng.pid"  # where the library looks for it
start_quorlogd "$build" "$db"
python3 scripts/send-numbered.py "$port" filler $filler 10 > /dev/null
await "the arrival of the filler" filled
"$quorlog" backup --db "$db" "$run/first.db"
python3 scripts/send-numbered.py "$port" numbered "$numbered" 4 3000 > /dev/null &
sender=$!
for round in $(seq "$rounds"); do
    echo "round $round"
    sleep 2
    timed "$quorlog" backup --db "$db" "$run/backup-$round.db"
    sleep 1
    timed "$quorlog" restore --db "$db" "$run/backup-$round.db" --yes
    merge_killed
    [ $((round % 2)) = 0 ] || { end KILL "$quorlogd" && start_quorlogd "$build" "$db"; }
    timed "$quorlog" delete --db "$db" --program filler --yes || true
    timed "$quorlog" db compact --db "$db" --yes || true
done
wait $sender
sleep 3
merge_all
"$quorlog" db merge "$run/first.db" --into "$db"
"$quorlog" db merge "$run/first.db" --into "$db"
await "the accounting" all_counted || true
[ "$(ask "$db" 'PRAGMA integrity_check')" = ok ] || fail "the log database is damaged"
echo "sent $numbered and $filler; stored $(rows numbered) and $(rows filler), different $(different numbered) and $(different filler); counted $(total)"
[ "$(rows numbered) $(different numbered) $(rows filler) $(total)" = "$numbered $numbered $filler $((numbered + filler))" ] ||
    fail "messages were lost, stored twice or not counted once"
ls "$db"*
