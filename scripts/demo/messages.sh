# The messages of the demonstration. Each carries a token of its own, kept in `sent`.
sent=()

# The next token, in `token`.
next_token() {
    token=$(printf 'demo-%03d' $((${#sent[@]} + 1)))
    sent+=("$token")
}

# by_logger TRANSPORT FORMAT PRIORITY TAG TEXT: from this host, as util-linux's logger sends it.
by_logger() {
    next_token
    logger -n 127.0.0.1 -P "$port" "$1" "$2" -p "$3" -t "$4" -- "$5 [$token]"
}

# as_host HOST NUMERIC_PRIORITY PROGRAM TEXT: what another device would send.
as_host() {
    next_token
    printf '<%d>1 %s %s %s - - - %s [%s]' "$2" "$(date +%Y-%m-%dT%H:%M:%S%:z)" "$1" "$3" "$4" "$token" \
        > "/dev/udp/127.0.0.1/$port"
}

send_messages() {
    by_logger -d --rfc3164 auth.err sshd "Failed password for root from 192.0.2.7 port 4242 ssh2"
    by_logger -T --rfc5424 daemon.info dhcpd "DHCPACK on 192.0.2.44 to 00:00:5e:00:53:01"
    by_logger -T --rfc3164 cron.info cron "(root) CMD (run-parts /etc/cron.hourly)"
    by_logger -d --rfc5424 user.debug app "cache refreshed"
    as_host switch-1 187 ifmgr "Interface 7 changed state to down"
    as_host switch-1 190 ifmgr "Interface 7 changed state to up"
    as_host switch-2 188 stp "Topology change on port 12"
    as_host firewall 4 kernel "DROP IN=eth0 SRC=198.51.100.9 DST=192.0.2.1 PROTO=TCP DPT=23"
    as_host firewall 129 kernel "disk full on /var"
    as_host printer 14 spooler "Grüße aus dem Drucker: Papier fehlt"
    # What a hostile sender would try.
    as_host intruder 11 "x';DROP" "'; DROP TABLE logs; --"
    as_host intruder 11 shell "\$(reboot) \`id\` | sh & \\\" \\\\ %s%n"
    as_host intruder 11 term $'\e[31mred\e[0m \e]0;owned\a \b\b\b hidden'
    as_host intruder 11 bytes $'bad utf-8 \xff\xfe\xc3( end'
    as_host intruder 11 html '<script>alert(1)</script> =cmd()'
    as_host intruder 11 glob '[x] *?% _ everything'
    for i in $(seq 1 40); do as_host "sensor-$((i % 4 + 1))" 166 thermo "temperature $((20 + i % 7)).$i C"; done
}
