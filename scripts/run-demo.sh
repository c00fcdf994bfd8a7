#!/usr/bin/env bash
# Starts the receiving chain on loopback, sends it messages, and shows what came of them.
# Usage: run-demo.sh BUILD_FOLDER       ONCE=1: end by itself, with status 0 when everything sent was found again.
set -euo pipefail
cd "$(dirname "$0")/.."
. scripts/demo/messages.sh
. scripts/receive.sh

build=$(cd "$1" && pwd)
root=$build/root
port=${QUOR_DEMO_PORT:-15514}
smtp_port=$((port + 2))
db=$root/var/log/quorlog/syslog.db
rules=$root/etc/quorsyslog/notify.conf
mails=$root/mails.txt
quorlog=$build/tools/quorlog/quorlog
children=()
syslog_ng=
quorlogd=

say() { printf '\n\033[1m%s\033[0m\n' "$*"; }
show() {
    say "\$ quorlog $*"
    "$quorlog" "$@"
}
fail() {
    echo "run-demo.sh: $*" >&2
    exit 1
}

stop() {
    end TERM "$syslog_ng" "${children[@]}"
    end TERM "$quorlogd"
}
trap stop EXIT
trap "exit 0" INT TERM

fresh_root() {
    rm -rf "$root/var/log" "$root/var/spool" "$root/usr/quor/etc" "$root/etc" "$root/run" "$mails"
    mkdir -p "$root/var/log/quorlog" "$root/etc/quorsyslog" "$root/run"
    cp etc/notify.filter "$root/etc/quorsyslog/notify.filter"
    cp scripts/demo/notify.conf "$rules"
    sed -e '/^smtp_mail_enabled=/s/"no"/"yes"/' -e '/^smtp_server=/s/".*"/"127.0.0.1"/' \
        -e "/^smtp_port=/s/\".*\"/\"$smtp_port\"/" -e '/^smtp_security=/s/".*"/"none"/' \
        etc/quorinfo.conf.example > "$root/etc/quorinfo.conf"
}

start_mail_server() {
    /usr/bin/python3 -u -m aiosmtpd -n -l "127.0.0.1:$smtp_port" -c aiosmtpd.handlers.Debugging stdout > "$mails" &
    children+=($!)
    await "the start of the mail server on port $smtp_port" listening "$smtp_port"
}

number=0  # of messages sent
all_stored() { [ "$(field count)" = "$number" ]; }

# Every message carries its number; each must come back by it.
check_found() {
    local missing=0
    for token in "${sent[@]}"; do
        "$quorlog" count --keyword "$token" > /dev/null || {
            echo "not found: $token" >&2
            missing=$((missing + 1))
        }
    done
    [ "$missing" -eq 0 ] || fail "$missing of ${#sent[@]} messages were not found"
    say "All ${#sent[@]} messages sent were found again."
}

field() { "$quorlog" "$@" --format csv | tail -n +2 | tr -d '\r'; }
samples_sum() { field stats eps --last 1d | awk -F, '{ sum += $2 } END { print sum + 0 }'; }
accounted() {
    kill -USR2 "$quorlogd"  # writes what it has counted
    [ "$(field stats total)" = "$number" ] && [ "$(samples_sum)" = "$number" ]
}
check_totals() {
    local rows total samples
    await "the arrival of $number messages" all_stored
    await "the accounting of $number messages" accounted
    rows=$(field count) total=$(field stats total) samples=$(samples_sum)
    say "$number messages sent, $rows rows stored, $total counted by device, $samples in the samples of the rate."
    [ "$rows" = "$total" ] && [ "$total" = "$samples" ] || fail "the numbers do not agree"
}

# Ten senders at full speed, and quorlogd killed among their messages: it goes on where its counts ended.
show_burst() {
    local burst=20000
    say "A burst of $burst messages over 10 connections; quorlogd is killed (kill -9) in the middle and started again ..."
    loggen --inet --stream --rate 1000000 --size 200 --number $((burst / 10)) --active-connections 10 --quiet \
        127.0.0.1 "$port" > /dev/null 2>&1 &
    sleep 0.5
    end KILL "$quorlogd"
    start_quorlogd "$build" "$db"
    wait %loggen || true
    number=$((number + burst))
    check_totals
}

mails_arrived() { [ "$(grep -c '^Subject:' "$mails")" -ge 2 ]; }

# A mail as it arrived, its body decoded for reading.
show_mails() {
    await "the arrival of the mails" mails_arrived
    say "The mails, as the recipient's server got them:"
    /usr/bin/python3 scripts/demo/show_mails.py "$mails"
}

by_hand() {
    say "The chain is up. In another terminal:"
    cat << TEXT
  $quorlog search --follow
  $quorlog search --host switch-1 --level err+ --from today
  logger -n 127.0.0.1 -P $port -d --rfc5424 -p auth.err -t sshd "Failed password for me"
  $quorlog --help-all
Mail arrives in $mails. Ctrl-C ends everything; the data stays in $root.
TEXT
    wait -n || true
}

fresh_root
start_mail_server
start_syslog_ng "$root/run" "$port" "$db"
echo "$syslog_ng" > "$root/run/syslog-ng.pid"  # where the library looks for it
start_quorlogd "$build" "$db"
say "Sending messages to 127.0.0.1:$port (UDP and TCP, RFC 3164 and RFC 5424) ..."
send_messages
number=${#sent[@]}
await "the arrival of $number messages" all_stored
show search --limit 8
show search --host intruder
show search --level err+ --limit 5 --offset 2 --format ndjson
show count
show count --level err+
check_found
check_totals
show stats top --limit 5
show stats eps
show names host
show events list
show_mails
show_burst
cp "$root/run/receiving.conf" "$root/etc/quorsyslog/"  # where its port is looked up
show doctor --control "$syslog_ng_control"
[ -n "${ONCE:-}" ] || by_hand
