#!/usr/bin/env bash
# Sends hostile messages through the receiving chain on loopback and shows what became of them: each is one row that
# holds what was sent, is counted once, and is found by its own text; the tables stay what they were.
# Usage: run-hostile.sh BUILD_FOLDER
set -euo pipefail
cd "$(dirname "$0")/.."
. scripts/receive.sh
export LC_ALL=C  # a character is a byte

build=$(cd "$1" && pwd)
root=$build/root
port=${QUOR_DEMO_PORT:-15514}
db=$root/var/log/quorlog/syslog.db
quorlog=$build/tools/quorlog/quorlog
pieces=("'" "''" '"' ";" "--" "/*" "*/" "[x]" "(" ")" "),(" "\\" "\\'" % _ '`' "*" "?" : ' OR 1=1' '; DROP TABLE logs'
    '$(reboot)' '${HOST}' %s%n '<13>' '<b>' '=cmd()' $'\e[2J' $'\x01' $'\x7f' $'\t' $'\r' $'\n' $'\xff' $'\xc3' "é" "日本"
    $'\xe2\x80\xae')
count=600

say() { printf '\n\033[1m%s\033[0m\n' "$*"; }
show() {
    say "\$ quorlog $*"
    "$quorlog" "$@"
}
fail() {
    echo "run-hostile.sh: $*" >&2
    exit 1
}
stop() {
    kill "$syslog_ng" 2> /dev/null || true
    wait "$syslog_ng" 2> /dev/null || true
}

# The message of a number, in $host, $program and $text: three pieces, different ones each time.
message() {
    local n=${#pieces[@]}
    host=h${pieces[$(($1 % n))]}
    program=p${pieces[$(($1 * 5 / 3 % n))]}
    text="<$(printf %03d "$1")>${pieces[$(($1 * 7 % n))]}${pieces[$(($1 / n * 11 % n))]}."
    host=${host//[, ]/} program=${program//[, ]/}  # a blank ends a name, and to quorlog a comma does
}

# Every second one to the port where a line is a message, the others, and those that hold line ends, to the framed one.
send() {
    local frame="<11>1 2026-11-21T10:00:00+00:00 $host $program - - - $text"
    if (($1 % 2)) && [[ $frame != *[$'\r\n']* ]]; then
        printf '%s\n' "$frame" >&4
    else
        printf '%d %s' ${#frame} "$frame" >&3
    fi
}

field() { "$quorlog" "$@" --format csv | tail -n +2 | tr -d '\r'; }
stored() { [ "$(field count)" = "$count" ]; }
accounted() {
    pkill -USR2 -P "$syslog_ng" quorlogd || true
    [ "$(field stats total)" = "$count" ]
}
definitions() { sqlite3 "$db" "SELECT name, sql FROM sqlite_schema"; }

# One row, with what syslog-ng is said to change: line ends in the text, control bytes in names. A message whose header
# it cannot read (a bracket or a colon in the host) is stored whole, under the program syslog-ng.
unreadable=0
is_one() { [ "$("$quorlog" count "$@" 2> /dev/null)" = 1 ]; }
check_found() {
    local keyword
    message "$1"
    keyword=--keyword=${text//[$'\r\n']/ }
    is_one "--host=${host//[[:cntrl:]]/_}" "--program=${program//[[:cntrl:]]/_}" "$keyword" && return
    is_one --program=syslog-ng "$keyword" || fail "not found: ${host@Q} ${program@Q} ${text@Q}"
    unreadable=$((unreadable + 1))
}

rm -rf "$root/var/log" "$root/usr/quor/etc" "$root/etc" "$root/run"
mkdir -p "$root/var/log/quorlog" "$root/etc/quorsyslog" "$root/run"
"$quorlog" rules set hostile --keyword '<00'
trap stop EXIT
start_syslog_ng "$root/run" "$port" "$db" "$build/tools/quorlogd/quorlogd"
say "Sending $count hostile messages to 127.0.0.1:$port and $((port + 1)) ..."
exec 4<> "/dev/tcp/127.0.0.1/$port" 3<> "/dev/tcp/127.0.0.1/$((port + 1))"
message 0
send 0
await "the first row" field count
before=$(definitions)
for number in $(seq $((count - 1))); do
    message "$number"
    send "$number"
done
await "the arrival of $count messages" stored
await "the accounting of $count messages" accounted
show search --limit 12
show search --keyword DROP --limit 3 --format ndjson
show stats top --limit 5
show events list --limit 3
for number in $(seq 0 $((count - 1))); do check_found "$number"; done
[ "$unreadable" -lt $((count / 10)) ] || fail "syslog-ng could not read the headers of $unreadable messages"
say "Each of the $count messages is one row, counted once, and was found by its text, host and program" \
    "(without the latter: $unreadable whose headers syslog-ng could not read)."
show db check --full
[ "$(definitions)" = "$before" ] || fail "the definitions of $db have changed"
