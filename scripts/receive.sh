# Sourced: a syslog-ng with the shipped configuration on loopback, and a quorlogd, for the scripts that need them.
# They call fail TEXT when something does not come about.

# Polls a condition for at most 20 seconds, or $patience.
await() {
    local what=$1
    shift
    for _ in $(seq "${patience:-20}0"); do
        if "$@" > /dev/null 2>&1; then return 0; fi
        sleep 0.1
    done
    fail "$what did not happen within ${patience:-20} seconds${syslog_ng_log:+; see $syslog_ng_log}"
}
listening() { (exec 3<> "/dev/tcp/127.0.0.1/$1") 2> /dev/null; }

# start_syslog_ng FOLDER PORT DATABASE: its process is then in $syslog_ng, its messages in $syslog_ng_log, its control
# socket in $syslog_ng_control. Started again
# in the same folder it goes on with what waits there. $buffer_size and $buffer_folder may be set.
start_syslog_ng() {
    local buffer=${buffer_folder:-$1/buffer} size=${buffer_size:-268435456}
    mkdir -p "$buffer"
    cat > "$1/receiving.conf" << CONF
@define quor_ip_protocol "4"
@define quor_address "127.0.0.1"
@define quor_port "$2"
@define quor_port_framed "$(($2 + 1))"
@define quor_database "$3"
@define quor_buffer "$buffer"
@define quor_buffer_size "$size"
@define quor_buffer_rest "$((size / 4))"
CONF
    sed "s|/etc/quorsyslog/receiving|$1/receiving|" etc/syslog-ng/quorsyslog.conf > "$1/quorsyslog.conf"
    printf '@version: 3.38\n@include "%s"\n' "$1/quorsyslog.conf" > "$1/syslog-ng.conf"
    syslog_ng_log=$1/syslog-ng.log syslog_ng_control=$1/ctl syslog_ng_port=$2
    /usr/sbin/syslog-ng -F -e --no-caps -f "$1/syslog-ng.conf" --persist-file "$1/persist" --control "$1/ctl" \
        --pidfile "$1/pid" >> "$syslog_ng_log" 2>&1 &
    syslog_ng=$!
    await "the start of syslog-ng on port $2" listening "$2"
    packaging/reserve-buffer "$buffer" "$size"
}

# start_quorlogd BUILD DATABASE: its process is then in $quorlogd, its messages in BUILD/root/run/quorlogd.log.
start_quorlogd() {
    mkdir -p "$1/root/run"
    "$1/tools/quorlogd/quorlogd" --db "$2" --control "${syslog_ng_control:-}" --udp-port "${syslog_ng_port:-514}" \
        --check-interval "${check_interval:-60}" --stderr >> "$1/root/run/quorlogd.log" 2>&1 &
    quorlogd=$!
    await "the start of quorlogd" grep -q "^quorlogd\[$quorlogd\]: Started" "$1/root/run/quorlogd.log"
}

# end SIGNAL PROCESS...: and waits for it.
end() {
    local signal=$1 process
    shift
    for process in "$@"; do
        [ -z "$process" ] || kill "-$signal" "$process" 2> /dev/null || true
    done
    for process in "$@"; do
        [ -z "$process" ] || wait "$process" 2> /dev/null || true
    done
}
