# Sourced: what syslog-ng's configuration has as a value. The last definition holds.
value() { # NAME
    cat /usr/share/quorsyslog/syslog-ng.conf /etc/quorsyslog/receiving*.conf 2> /dev/null |
        sed -n "s/^@define $1 \"\(.*\)\".*/\1/p" | tail -n 1
}
