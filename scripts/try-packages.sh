#!/bin/sh
# Installs the packages in a clean Debian over what a former version left, counts on from there, removes and purges them,
# and looks for what is left.
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
    libjsoncpp25 libcurl4 libre2-9 libutf8proc2 g++ pkg-config > "$packages/install.log" 2>&1
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

echo "== goes"
echo smtp_password=x > "$root/etc/quorinfo.conf"
inside apt-get remove -y -qq quorsyslog libquorsyslog-dev libquorsyslog1 >> "$packages/install.log" 2>&1
inside syslog-ng --syntax-only --no-caps || fail "syslog-ng refuses its configuration after the removal"
inside dpkg --purge quorsyslog libquorsyslog-dev libquorsyslog1 >> "$packages/install.log" 2>&1
rm "$root/usr/sbin/policy-rc.d"
listing > "$packages/after.txt"
echo "== left behind"
diff "$packages/before.txt" "$packages/after.txt" | grep '^[<>]' | tee "$packages/left.txt" || true
! grep -vE '^> \./(usr/quor(/etc(/quorsyslog\.db.*)?)?|var/log/(quorlog(/.*)?|apt/.*|dpkg.log|alternatives.log))$' \
    "$packages/left.txt" || fail "more than data was left behind"
