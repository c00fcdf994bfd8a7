#!/usr/bin/env bash
# The receiving chain under bursts, locks, kills, restarts, floods and damage. After each trial every stored row must be counted once; what
# was lost on the way to the database, or stored twice, is told.
# Usage: try-faults.sh BUILD_FOLDER [KILLS [LOCK_SECONDS [BURST]]]     KEEP=1: leave the data for a look
# ONLY="NAME..." runs those trials alone.
set -euo pipefail
cd "$(dirname "$0")/.."
. scripts/receive.sh

build=$(cd "$1" && pwd)
kills=${2:-5}
lock_seconds=${3:-5}
burst=${4:-100000}
port=${QUOR_FAULTS_PORT:-15914}
root=$build/root
db=$root/var/log/quorlog/syslog.db
accounting=$root/var/log/quorlog/.QUORACCOUNTDB
events=$root/usr/quor/etc/quorsyslog.db
check_interval=5
run=$(mktemp -d /tmp/quor-faults-XXXXXX)
syslog_ng=
quorlogd=
status=0
patience=120

fail() {
    echo "try-faults.sh: $*" >&2
    exit 1
}
finish() {
    end TERM "$syslog_ng"
    end TERM "$quorlogd"
    [ -n "${KEEP:-}" ] || rm -rf "$run"
}
trap finish EXIT

start() {
    start_syslog_ng "$run" "$port" "$db"
    echo "$syslog_ng" > "$root/run/syslog-ng.pid"  # where the library looks for it
}
follow() { start_quorlogd "$build" "$db"; }
ask() { sqlite3 -readonly "$1" '.timeout 10000' "$2" 2> /dev/null; }
now() { date +%s%N; }
# Milliseconds of processor time so far of a process.
used() { awk '{ print ($14 + $15) * 10 }' "/proc/$1/stat"; }
rows() { ask "$db" 'SELECT count(*) FROM logs'; }
total() { ask "$accounting" 'SELECT ifnull(sum(count), 0) FROM histogram'; }
samples() { ask "$accounting" 'SELECT ifnull(sum(eps), 0) FROM eps'; }
of_trial() { ask "$db" "SELECT $1 FROM logs WHERE prog = '$trial'"; }
quiet() {
    local before
    before=$(rows)
    sleep 2
    [ "$(rows)" = "$before" ]
}
counted() {
    kill -USR2 "$quorlogd"
    [ "$(total)" = "$(rows)" ] && [ "$(samples)" = "$(rows)" ]
}
send() { python3 scripts/send-numbered.py "$port" "$trial" "$@" > "$run/sent"; }
shortly() { sleep "0.$((RANDOM % 9))$((RANDOM % 10))"; }

# A line of the table: of one trial, whose name is in $trial.
report() {
    local sent stored different note=$1
    await "the end of $trial" quiet
    await "the accounting of $trial" counted
    sent=$(cat "$run/sent") stored=$(of_trial 'count(*)') different=$(of_trial 'count(DISTINCT msg)')
    printf '%-16s %9d %9d %7d %7d %9d  %s\n' "$trial" "$sent" "$stored" $((sent - different)) $((stored - different)) \
        "$(total)" "$note"
    [ "$lossless" != yes ] || [ "$sent/$stored" = "$different/$different" ] || status=1
}

all_there() { [ "$(of_trial 'count(*)')" -ge "$burst" ]; }
try_burst() { # CONNECTIONS
    local begin used_before taken stored
    begin=$(now) used_before=$(($(used "$syslog_ng") + $(used "$quorlogd")))
    send "$burst" "$1"
    taken=$((($(now) - begin) / 1000000))
    await "the arrival of $trial" all_there
    stored=$((($(now) - begin) / 1000000))
    report "taken in $taken ms, stored in $stored ms"
    echo "                 processor time a message: $(((($(used "$syslog_ng") + $(used "$quorlogd")) - used_before) * 1000 / burst)) us"
}

try_lock() {
    send $((2000 * (lock_seconds + 4))) 1 2000 &
    sleep 1
    python3 -c 'import sqlite3, sys, time
db = sqlite3.connect(sys.argv[1], timeout=60, isolation_level=None)
db.execute("BEGIN EXCLUSIVE")
time.sleep(float(sys.argv[2]))' "$db" "$lock_seconds"
    wait %send
    report "2,000 a second"
}

# try_ends SIGNAL PROCESS: ends it (or both) again and again while messages arrive, and starts it anew.
try_ends() {
    local signal=$1 process=$2
    send $((kills * 1500)) 4 2000 &
    for _ in $(seq "$kills"); do
        shortly
        [ "$process" = quorlogd ] || { end "$signal" "$syslog_ng" && start; }
        [ "$process" = syslog-ng ] || { end "$signal" "$quorlogd" && follow; }
    done
    wait %send
    report "$kills times"
}

try_unreadable_counts() {
    end TERM "$quorlogd"
    mv "$accounting" "$run/counts"
    mkdir "$accounting"
    follow
    send 10000 1 5000
    sleep 1
    kill -0 "$quorlogd" 2> /dev/null || echo "                 quorlogd ended"
    rmdir "$accounting"
    mv "$run/counts" "$accounting"
    kill -0 "$quorlogd" 2> /dev/null || follow
    report "counts unreadable at the start, then put back"
}

# Datagrams as fast as one sender makes them: each is stored, or told as dropped.
try_udp() {
    local sent=200000 stored told
    python3 -c 'import socket, sys
sender = socket.socket(socket.AF_INET, socket.SOCK_DGRAM)
for i in range(int(sys.argv[2])):
    sender.sendto(b"<13>Nov 21 10:00:00 host udp: number %09d %s" % (i, b"x" * 120), ("127.0.0.1", int(sys.argv[1])))' "$port" $sent
    await "the end of $trial" quiet
    stored=$(of_trial 'count(DISTINCT msg)')
    told_all() {
        told=$(ask "$events" "SELECT ifnull(sum(CAST(substr(event, instr(event, '[') + 1) AS INTEGER)), 0) FROM log WHERE event LIKE '%messages were dropped%'")
        [ $((stored + told)) = $sent ]
    }
    await "word of what was dropped" told_all
    await "the accounting of $trial" counted
    printf '%-16s %9d %9d %7d %7d %9d  %s\n' "$trial" $sent "$stored" $((sent - stored)) 0 "$(total)" "$told told as dropped"
}

# From the reception of a message to the notice about it, at 1,000 messages a second.
try_delay() {
    local count=50
    echo "webhook_url=\"http://127.0.0.1:$((port + 2))\"" > "$root/etc/quorinfo.conf"
    printf '[rule]\nnotify_type="2"\nnotify_pri="0"\nnotify_eps="0"\nnotify_pat="tell me"\nnotify_enable="1"\n' \
        > "$root/etc/quorsyslog/notify.conf"
    kill -HUP "$quorlogd"
    send $((count * 1000)) 1 1000 &
    python3 scripts/notice-delay.py "$port" $((port + 2)) "tell me" $count > "$run/delay" || status=1
    wait %send
    rm "$root/etc/quorinfo.conf" "$root/etc/quorsyslog/notify.conf"
    kill -HUP "$quorlogd"
    report "$(cat "$run/delay")"
}

# Pages of the database are overwritten while messages arrive: it is moved aside, and what it held can be saved.
try_damage() {
    local before aside=$db.corrupt
    before=$(total)
    send 60000 1 3000 &
    sleep 8
    python3 -c 'import os, sys
file = os.open(sys.argv[1], os.O_WRONLY)
os.pwrite(file, b"\xa5" * 262144, 16384)' "$db"
    await "the end of the damaged database" test -f "$aside"
    wait %send
    await "the end of $trial" quiet
    all_counted() { kill -USR2 "$quorlogd" && [ $(($(total) - before)) -ge "$(rows)" ]; }
    await "the accounting of $trial" all_counted
    "$build/tools/quorlog/quorlog" db salvage "$aside" "$run/saved.db" > /dev/null
    python3 -c 'import sqlite3, sys
texts, counts = set(), []
for path in sys.argv[2:]:
    rows = [row[0] for row in sqlite3.connect(path).execute("SELECT msg FROM logs WHERE prog = ?", [sys.argv[1]])]
    counts.append(len(rows))
    texts.update(rows)
print(f"{sys.argv[1]:16} {60000:9} {sum(counts):9} {60000 - len(texts):7} {sum(counts) - len(texts):7}            {counts[0]} saved, {counts[1]} in the new one")' \
        "$trial" "$run/saved.db" "$db"
    echo "                 $(($(total) - before)) of them counted"
}

# try NAME COMMAND...
try() {
    trial=$1
    shift
    [[ " ${ONLY:-$trial} " != *" $trial "* ]] || "$@"
}

rm -rf "$root/var/log/quorlog" "$root/etc/quorsyslog" "$root/usr/quor/etc" "$root/run"
mkdir -p "$root/var/log/quorlog" "$root/etc/quorsyslog" "$root/usr/quor/etc" "$root/run"
start
follow
printf '%-16s %9s %9s %7s %7s %9s\n' trial sent stored lost twice counted
lossless=yes
for connections in 1 10 200; do try "burst-$connections" try_burst $connections; done
try "lock-${lock_seconds}s" try_lock
try kill-quorlogd try_ends KILL quorlogd
try stop-quorlogd try_ends TERM quorlogd
try unreadable try_unreadable_counts
try udp try_udp
try delay try_delay
lossless=
try kill-syslog-ng try_ends KILL syslog-ng
try kill-both try_ends KILL both
try stop-syslog-ng try_ends TERM syslog-ng
try damage try_damage
[ "$(ask "$db" 'PRAGMA integrity_check')" = ok ] || fail "the log database is damaged"
echo "$(rows) rows, $(total) counted, $(samples) in the samples of the rate"
[ "$status" = 0 ] || fail "messages were lost, stored twice or not counted where that must not happen"
