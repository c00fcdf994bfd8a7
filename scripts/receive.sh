# Sourced: a syslog-ng with the shipped configuration on loopback, for the scripts that need one.

# Polls a condition for at most 20 seconds.
await() {
    local what=$1
    shift
    for _ in $(seq 200); do
        if "$@" > /dev/null 2>&1; then return 0; fi
        sleep 0.1
    done
    fail "$what did not happen within 20 seconds${syslog_ng_log:+; see $syslog_ng_log}"
}
listening() { (exec 3<> "/dev/tcp/127.0.0.1/$1") 2> /dev/null; }

# start_syslog_ng FOLDER PORT DATABASE RECEIVER: its process is then in $syslog_ng, its messages in $syslog_ng_log.
start_syslog_ng() {
    sed -e "/^@define quor_address /s|\".*\"|\"127.0.0.1\"|" -e "/^@define quor_port /s|\".*\"|\"$2\"|" \
        -e "/^@define quor_port_framed /s|\".*\"|\"$(($2 + 1))\"|" -e "/^@define quor_database /s|\".*\"|\"$3\"|" \
        -e "/^@define quor_receiver /s|\".*\"|\"$4\"|" etc/syslog-ng/quorsyslog.conf > "$1/quorsyslog.conf"
    printf '@version: 3.38\n@include "%s"\n' "$1/quorsyslog.conf" > "$1/syslog-ng.conf"
    /usr/sbin/syslog-ng -F -e --no-caps -f "$1/syslog-ng.conf" --persist-file "$1/persist" --control "$1/ctl" \
        --pidfile "$1/pid" > "$1/syslog-ng.log" 2>&1 &
    syslog_ng=$!
    syslog_ng_log=$1/syslog-ng.log
    await "the start of syslog-ng on port $2" listening "$2"
}
