#!/bin/sh
# Installs the packages in a clean Debian over what a former version left, counts on from there, upgrades with values of a
# site, receives, also encrypted, reads as a member of adm and as a stranger, removes and purges, and looks for what is left.
# Needs root. Usage: try-packages.sh FOLDER_OF_PACKAGES NEW_FOLDER_FOR_THE_ROOT
set -eu
packages=$1
root=$2
arch=$(dpkg --print-architecture)
suite=$(. /etc/os-release && echo "$VERSION_CODENAME")

fail() {
    echo "try-packages.sh: $*" >&2
    exit 1
}
inside() { chroot "$root" env DEBIAN_FRONTEND=noninteractive LC_ALL=C PATH=/usr/sbin:/usr/bin:/sbin:/bin "$@"; }
as() { # USER COMMAND...
    user=$1
    shift
    chroot --userspec="$user" "$root" env LC_ALL=C PATH=/usr/bin:/bin "$@"
}
await() { # WHAT COMMAND...
    what=$1
    shift
    for _ in $(seq 100); do
        ! "$@" > /dev/null 2>&1 || return 0
        sleep 0.2
    done
    fail "$what did not happen"
}
stored() { inside quorlog count --keyword "$1"; }
# Everything but what apt, dpkg and the dependencies keep for themselves.
listing() { (cd "$root" && find . -xdev \( -path ./proc -o -path ./tmp -o -path ./var/lib -o -path ./var/cache \) -prune -o -print | sort); }

mirror=$(apt-get indextargets --format '$(REPO_URI)' 'Created-By: Packages' 'Origin: Debian' "Codename: $suite" | head -n 1)
[ -n "$mirror" ] || fail "no Debian package source is configured; run apt-get update and try again"
rm -rf "$root"
debootstrap --variant=minbase "$suite" "$root" "$mirror" > "$packages/debootstrap.log" ||
    fail "debootstrap failed; see $packages/debootstrap.log"
mount -t proc proc "$root/proc" 2> /dev/null || true
finish() {
    for name in syslog-ng quorlogd; do inside invoke-rc.d "$name" stop > /dev/null 2>&1 || true; done
    umount "$root/proc" 2> /dev/null || true
}
trap finish EXIT
inside apt-get update -qq
inside apt-get install -y -qq --no-install-recommends syslog-ng-core syslog-ng-mod-sql libdbd-sqlite3 sqlite3 \
    libjsoncpp25 libcurl4 libre2-9 libutf8proc2 openssl g++ pkg-config > "$packages/install.log" 2>&1
inside useradd -M -G adm reader
inside useradd -M stranger
listing > "$packages/before.txt"

printf '#!/bin/sh\nexit 0\n' > "$root/usr/sbin/policy-rc.d" # services start in this chroot too
chmod +x "$root/usr/sbin/policy-rc.d"
# A former version: quorlogd was started by syslog-ng, with options, and a port of the site's own; three rows are counted.
former=$root/tmp/former
mkdir -p "$former/DEBIAN" "$former/etc/quorsyslog" "$former/var/log/quorlog" "$former/usr/bin"
printf '@define quor_address "0.0.0.0"\n@define quor_port "514"\n@define quor_database "/var/log/quorlog/syslog.db"\n%s\n' \
    '@define quor_receiver "/usr/bin/quorlogd --max-line 9000 --check-interval 300"' > "$former/etc/quorsyslog/syslog-ng.conf"
echo /etc/quorsyslog/syslog-ng.conf > "$former/DEBIAN/conffiles"
printf 'Package: quorsyslog\nVersion: 0.1\nArchitecture: %s\nMaintainer: none\nDescription: former\n' "$arch" \
    > "$former/DEBIAN/control"
chmod 0750 "$former/var/log/quorlog"
dpkg-deb --root-owner-group --build "$former" "$former.deb" > /dev/null
inside dpkg -i /tmp/former.deb >> "$packages/install.log"
sed -i 's/"514"/"5514"/' "$root/etc/quorsyslog/syslog-ng.conf"
inside sqlite3 /var/log/quorlog/syslog.db "CREATE TABLE logs (id INTEGER PRIMARY KEY AUTOINCREMENT, msg TEXT, prio TEXT,
    llevel TEXT GENERATED ALWAYS AS (prio) VIRTUAL, ldate TEXT, host TEXT, prog TEXT, fac TEXT, ltime TEXT, ip TEXT,
    tag TEXT, utcsec INTEGER, tzoffset TEXT); INSERT INTO logs (host, utcsec) VALUES ('nas', 1), ('nas', 1), ('nas', 1)"
inside sqlite3 /var/log/quorlog/.QUORACCOUNTDB "CREATE TABLE eps (id INTEGER PRIMARY KEY, stamp INTEGER, device TEXT,
    eps INTEGER); CREATE TABLE histogram (id INTEGER PRIMARY KEY, device TEXT UNIQUE, count INTEGER);
    INSERT INTO histogram (device, count) VALUES ('nas', 3)"

rm -rf "$former" "$former.deb"
cp "$packages"/*_"$arch".deb "$root/tmp/"
inside sh -c 'apt-get install -y -qq --no-install-recommends /tmp/*.deb' >> "$packages/install.log" 2>&1 ||
    fail "the packages do not install; see $packages/install.log"

echo "== runs"
inside quorlogd --version
inside syslog-ng --syntax-only --no-caps || fail "syslog-ng refuses its configuration"
for value in '@define quor_port "5514"' 'QUORLOGD_OPTIONS="--check-interval 300"'; do
    inside grep -qxF "$value" /etc/quorsyslog/receiving.conf /etc/default/quorlogd || fail "not carried on: $value"
done
inside pidof -c quorlogd > /dev/null || fail "quorlogd does not run"
inside sqlite3 /var/log/quorlog/syslog.db "INSERT INTO logs (host, utcsec) VALUES ('nas', 1), ('switch', 1)"
inside invoke-rc.d quorlogd stop
[ "$(inside quorlog stats total --format csv | tail -n 1 | tr -d '\r')" = 5 ] || fail "the rows were not counted once"
! inside find /var/log/quorlog /usr/quor/etc -type f -perm /007 | grep . || fail "everybody may read logs"
inside quorlog events list | grep -qi start || fail "the start was not recorded"
printf '#include <quorsyslog/common.h>\nint main() { return ullNumberToString(7) != "7"; }\n' > "$root/tmp/user.cpp"
inside sh -c 'cd /tmp && g++ user.cpp $(pkg-config --cflags --libs quorsyslog) -o user && ./user' ||
    fail "a program of a user does not build"

echo "== upgrades with values of the site, and asks nothing"
values=$root/etc/quorsyslog/receiving.conf
printf '@define %s "%s"\n' quor_ip_protocol 4 quor_address 127.0.0.1 quor_port 5515 quor_port_framed 5516 quor_port_tls 5517 \
    >> "$values"
echo '# of the site' >> "$root/etc/quorsyslog/notify.filter"
cp "$values" "$root/tmp/receiving.conf"
mkdir "$root/tmp/newer"
for package in "$root"/tmp/*_"$arch".deb; do
    dpkg-deb -R "$package" "$root/tmp/content"
    sed -i -e 's/^Version: .*/Version: 99/' -e 's/(= [0-9][^)]*)/(= 99)/' "$root/tmp/content/DEBIAN/control"
    dpkg-deb --root-owner-group --build "$root/tmp/content" "$root/tmp/newer/" > /dev/null
    rm -r "$root/tmp/content"
done
inside syslog-ng --pidfile /run/syslog-ng.pid
inside sh -c 'apt-get install -y -qq --no-install-recommends /tmp/newer/*.deb < /dev/null' >> "$packages/install.log" 2>&1 ||
    fail "the upgrade failed; see $packages/install.log"
cmp "$values" "$root/tmp/receiving.conf" || fail "the upgrade changed the values"
! find "$root/etc" -name '*.dpkg-*' | grep . || fail "the upgrade left questions"
await "a message on the port of the site" inside logger -n 127.0.0.1 -T -P 5515 -t trial upgraded
await "the message's row" stored upgraded
inside quorlog doctor | grep '^udp  *good  *UDP port 5515 is open' > /dev/null || fail "the port of the site is not known"

echo "== takes encrypted logs"
inside quorlog-tls on logs.example.com > "$packages/tls.txt"
cp "$root/etc/quorsyslog/tls/ca.key" "$root/tmp/"
inside quorlog-tls on > /dev/null
cmp "$root/etc/quorsyslog/tls/ca.key" "$root/tmp/ca.key" || fail "a key was replaced"
inside quorlog-tls client sender > /dev/null
encrypted() { # TEXT OPTIONS...
    message="<13>1 - - trial - - - $1"
    shift
    printf '%d %s' ${#message} "$message" | timeout 10 openssl s_client -connect 127.0.0.1:5517 -no_ign_eof \
        -CAfile "$root/etc/quorsyslog/tls/ca.pem" -verify_return_error -verify_hostname logs.example.com "$@" > /dev/null 2>&1
}
encrypted secret1 || fail "the certificate does not fit"
await "the encrypted message's row" stored secret1
inside quorlog-tls senders known
encrypted secret2 || true
sender=$root/etc/quorsyslog/tls/clients/sender
encrypted secret3 -cert "$sender.pem" -key "$sender.key"
await "the known sender's row" stored secret3
! stored secret2 > /dev/null || fail "a sender without a certificate was taken"
inside quorlog-tls off

echo "== lets members of adm read, and tells strangers why not"
for command in count 'search --limit 1' 'stats total' 'stats top' 'events list' 'names host' 'rules list' 'db info' doctor; do
    status=0
    # shellcheck disable=SC2086  # a list of words
    as reader quorlog $command > "$packages/reader.txt" 2>&1 || status=$?
    [ "$status" -lt 2 ] ||
        fail "a member of adm: quorlog $command: $(cat "$packages/reader.txt")"
done
(umask 077 && echo smtp_password=x > "$root/etc/quorinfo.conf")
for command in count 'stats total' 'events list' 'notify test'; do
    # shellcheck disable=SC2086
    ! as stranger quorlog $command > "$packages/stranger.txt" 2>&1 || fail "a stranger may run quorlog $command"
    grep -Eq 'it is for group adm: sudo adduser stranger adm|run as root' "$packages/stranger.txt" ||
        fail "a stranger hears no cause: $(cat "$packages/stranger.txt")"
done

echo "== goes"
inside apt-get remove -y -qq quorsyslog libquorsyslog-dev libquorsyslog1 >> "$packages/install.log" 2>&1
[ -s "$root/var/log/quorlog/syslog.db" ] || fail "the removal took the logs"
inside syslog-ng --syntax-only --no-caps || fail "syslog-ng refuses its configuration after the removal"
inside dpkg --purge quorsyslog libquorsyslog-dev libquorsyslog1 >> "$packages/install.log" 2>&1
inside sh -c 'kill $(cat /run/syslog-ng.pid)' && sleep 1
rm -f "$root/usr/sbin/policy-rc.d" "$root"/run/syslog-ng.* "$root"/tmp/ca.key
listing > "$packages/after.txt"
echo "== left behind by a purge"
diff "$packages/before.txt" "$packages/after.txt" | grep '^[<>]' | tee "$packages/left.txt" || true
syslog_ng='dev/(log|xconsole)|run/syslog-ng|var/log/(auth|daemon|debug|error|kern|messages|syslog|user)(\.log)?'
! grep -vE "^> \./($syslog_ng|var/log/(apt/.*|dpkg.log|alternatives.log))\$" "$packages/left.txt" || fail "something was left behind"
