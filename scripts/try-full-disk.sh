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
quorlogd=
sent=0
buffer_folder=$disk/log/quorlog/buffer # on the disk that fills up
buffer_size=8388608

fail() {
    echo "try-full-disk.sh: $*" >&2
    tail -n 5 "$syslog_ng_log" >&2
    exit 1
}
finish() {
    end TERM "$syslog_ng"
    end TERM "$quorlogd"
    rm -rf "$run"
}
trap finish EXIT

send() { python3 scripts/send-numbered.py "$port" "$1" "$2" > /dev/null; } # NAME COUNT
rows() { "$quorlog" count --format csv 2> /dev/null | tail -n 1 | tr -d '\r'; }
all_stored() { [ "$(rows)" = "$sent" ]; }
total() { "$quorlog" stats total --format csv | tail -n 1 | tr -d '\r'; }
all_counted() {
    kill -USR2 "$quorlogd"
    [ "$(total)" = "$sent" ] && [ "$(samples)" = "$sent" ]
}
samples() { "$quorlog" stats eps --last 1h --format csv | awk -F, 'NR > 1 { sum += $2 } END { print sum + 0 }'; }

mkdir -p "$disk" "$build/root/usr/quor/etc"
rm -rf "$build/root/etc/quorsyslog" "$build/root/usr/quor/etc/quorsyslog.db"*
mount -t tmpfs -o size=48m none "$disk"
mkdir -p "$disk/log/quorlog"
start_syslog_ng "$run" "$port" "$db"
start_quorlogd "$build" "$db"

send before 1000
sent=1000
await "the arrival of 1,000 messages" all_stored
await "their accounting" all_counted
dd if=/dev/zero of="$disk/ballast" bs=1k count=100000 2> /dev/null || true
send meanwhile 40000 & # more than the disk-buffer holds: the sender has to wait
sent=$((sent + 40000))
sleep 10
echo "full disk: $(df --output=avail -k "$disk" | tail -n 1 | tr -d ' ') KiB free, $(rows) of $sent messages stored"
[ "$(rows)" -lt "$sent" ] || fail "the disk was not full"
"$quorlog" search --limit 2 > /dev/null || fail "a full disk cannot be searched"
kill -USR2 "$quorlogd"

rm "$disk/ballast"
wait %send
send after 1
sent=$((sent + 1))
await "the arrival of $sent messages" all_stored
await "their accounting" all_counted
echo "space again: $(rows) of $sent messages stored, $(total) counted, $(samples) in the samples of the rate"
different=$(sqlite3 "$db" "SELECT count(DISTINCT prog || msg) FROM logs")
[ "$different" = "$sent" ] || fail "only $different messages differ"
for file in "$db" "$disk/log/quorlog/.QUORACCOUNTDB" "$build/root/usr/quor/etc/quorsyslog.db"; do
    [ "$(sqlite3 "$file" 'PRAGMA integrity_check')" = ok ] || fail "$file is damaged"
done
echo "All $sent messages were stored once; the databases are sound."
