#!/bin/sh
# Installs the packages in a clean Debian, receives and finds a log, removes and purges them, and looks for what is left.
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
trap 'umount "$root/proc" 2> /dev/null || true' EXIT
inside apt-get update -qq
inside apt-get install -y -qq --no-install-recommends syslog-ng-core syslog-ng-mod-sql libdbd-sqlite3 sqlite3 \
    libjsoncpp25 libcurl4 g++ pkg-config > "$packages/install.log" 2>&1
listing > "$packages/before.txt"

cp "$packages"/*_"$arch".deb "$root/tmp/"
inside sh -c 'apt-get install -y -qq --no-install-recommends /tmp/*.deb' >> "$packages/install.log" 2>&1 ||
    fail "the packages do not install; see $packages/install.log"

echo "== runs"
inside quorlogd --version
inside syslog-ng --syntax-only --no-caps || fail "syslog-ng refuses its configuration"
inside sh -c 'printf "user err 2026-01-02 10:00:00 1 1 +00:00 nas 10.0.0.1 app t hello\n" | quorlogd'
inside quorlog stats total | grep -q 1 || fail "the log was not counted"
inside quorlog events list | grep -qi start || fail "the start was not recorded"
printf '#include <quorsyslog/common.h>\nint main() { return ullNumberToString(7) != "7"; }\n' > "$root/tmp/user.cpp"
inside sh -c 'cd /tmp && g++ user.cpp $(pkg-config --cflags --libs quorsyslog) -o user && ./user' ||
    fail "a program of a user does not build"

echo "== goes"
inside apt-get remove -y -qq quorsyslog libquorsyslog-dev libquorsyslog1 >> "$packages/install.log" 2>&1
inside syslog-ng --syntax-only --no-caps || fail "syslog-ng refuses its configuration after the removal"
inside dpkg --purge quorsyslog libquorsyslog-dev libquorsyslog1 >> "$packages/install.log" 2>&1
listing > "$packages/after.txt"
echo "== left behind"
diff "$packages/before.txt" "$packages/after.txt" | grep '^[<>]' | tee "$packages/left.txt" || true
! grep -vE '^> \./(usr/quor(/etc(/quorsyslog\.db.*)?)?|var/log/(quorlog(/.*)?|apt/.*|dpkg.log|alternatives.log))$' \
    "$packages/left.txt" || fail "more than data was left behind"
