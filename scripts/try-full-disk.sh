#!/usr/bin/env bash
# The receiving chain on a disk of a few MiB that fills up and is freed again: what came in between must be stored,
# counted and searched afterwards. Needs root, for a file system of its own that nothing else sees.
# Usage: try-full-disk.sh BUILD_FOLDER
set -euo pipefail
cd "$(dirname "$0")/.."
. scripts/receive.sh

if [ -z "${OWN_MOUNTS:-}" ]; then
    OWN_MOUNTS=1 exec unshare --mount --propagation private "$0" "$@"
fi
build=$(cd "$1" && pwd)
port=${QUOR_FULL_DISK_PORT:-15814}
disk=$build/root/var
db=$disk/log/quorlog/syslog.db
quorlog=$build/tools/quorlog/quorlog
run=$(mktemp -d /tmp/quor-full-disk-XXXXXX)
syslog_ng=
sent=0

fail() {
    echo "try-full-disk.sh: $*" >&2
    tail -n 5 "$syslog_ng_log" >&2
    exit 1
}
finish() {
    [ -z "$syslog_ng" ] || { kill "$syslog_ng" && wait "$syslog_ng"; } 2> /dev/null || true
    rm -rf "$run"
}
trap finish EXIT

# send COUNT: each message with a number of its own.
send() {
    for _ in $(seq "$1"); do
        sent=$((sent + 1))
        printf '<11>%s full-disk test: number %05d %s\n' "$(date '+%b %e %T')" "$sent" "$(printf '%0200d' 0)"
    done > "/dev/tcp/127.0.0.1/$port"
}
rows() { "$quorlog" count --format csv 2> /dev/null | tail -n 1 | tr -d '\r'; }
all_stored() { [ "$(rows)" = "$sent" ]; }
total() { "$quorlog" stats total --format csv | tail -n 1 | tr -d '\r'; }
all_counted() {
    pkill -USR2 -P "$syslog_ng" quorlogd
    [ "$(total)" = "$sent" ] && [ "$(samples)" = "$sent" ]
}
samples() { "$quorlog" stats eps --last 1h --format csv | awk -F, 'NR > 1 { sum += $2 } END { print sum + 0 }'; }

mkdir -p "$disk" "$build/root/usr/quor/etc"
rm -rf "$build/root/etc/quorsyslog" "$build/root/usr/quor/etc/quorsyslog.db"*
mount -t tmpfs -o size=48m none "$disk"
mkdir -p "$disk/log/quorlog"
start_syslog_ng "$run" "$port" "$db" "$build/tools/quorlogd/quorlogd"

send 1000
await "the arrival of 1,000 messages" all_stored
await "their accounting" all_counted
dd if=/dev/zero of="$disk/ballast" bs=1k count=100000 2> /dev/null || true
send 4000
sleep 5
echo "full disk: $(df --output=avail -k "$disk" | tail -n 1 | tr -d ' ') KiB free, $(rows) of $sent messages stored"
[ "$(rows)" -lt "$sent" ] || fail "the disk was not full"
"$quorlog" search --limit 2 > /dev/null || fail "a full disk cannot be searched"
pkill -USR2 -P "$syslog_ng" quorlogd

rm "$disk/ballast"
send 1
await "the arrival of $sent messages" all_stored
await "their accounting" all_counted
echo "space again: $(rows) of $sent messages stored, $(total) counted, $(samples) in the samples of the rate"
different=$(sqlite3 "$db" "SELECT count(DISTINCT substr(msg, 1, 12)) FROM logs")
[ "$different" = "$sent" ] || fail "only $different messages differ"
for file in "$db" "$disk/log/quorlog/.QUORACCOUNTDB" "$build/root/usr/quor/etc/quorsyslog.db"; do
    [ "$(sqlite3 "$file" 'PRAGMA integrity_check')" = ok ] || fail "$file is damaged"
done
echo "All $sent messages were stored once; the databases are sound."
