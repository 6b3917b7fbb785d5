#!/usr/bin/env bash
# Installs the Debian package in a fresh Debian 12 root, as a new user would, and runs it there:
# --version, --list --json, the service packing and installing a game, the window started by the desktop
# entry's command (under Xvfb, until it has filled its list), then apt-get remove and a check that nothing
# of the package is left while the user's settings and games are untouched.
# Needs root (debootstrap, chroot). The base root is made once and kept in $BRIMVAULT_TEST_ROOT.base.tar.
set -euo pipefail
deb=$(readlink -f "${1:?usage: tools/test-package.sh build/brimvault_VERSION_amd64.deb}")
[ "$(id -u)" -eq 0 ] || { echo "test-package needs root (debootstrap and chroot)" >&2; exit 2; }
command -v debootstrap >/dev/null || DEBIAN_FRONTEND=noninteractive apt-get install -y -qq debootstrap

base=${BRIMVAULT_TEST_ROOT:-/var/tmp/brimvault-debian12}
root=$base.run
mirror=$(sed -n 's/^URIs: *//p' /etc/apt/sources.list.d/debian.sources 2>/dev/null | head -n1)
mirror=${mirror:-http://deb.debian.org/debian}
if [ ! -f "$base.base.tar" ]; then
    rm -rf "$base.tmp"
    debootstrap --variant=minbase bookworm "$base.tmp" "$mirror"
    tar -C "$base.tmp" -cf "$base.base.tar" .
    rm -rf "$base.tmp"
fi

cleanup() {
    for m in dev/pts dev proc sys; do umount -l "$root/$m" 2>/dev/null || true; done
}
trap cleanup EXIT
cleanup
rm -rf "$root" && mkdir -p "$root"
tar -C "$root" -xf "$base.base.tar"
for m in proc sys dev dev/pts; do mount --bind "/$m" "$root/$m"; done
cp /etc/resolv.conf "$root/etc/resolv.conf" 2>/dev/null || true
cp "$deb" "$root/tmp/"
in_root() { chroot "$root" env -i PATH=/usr/sbin:/usr/bin:/sbin:/bin HOME=/home/player LANG=C.UTF-8 \
    QT_QPA_PLATFORM=offscreen DEBIAN_FRONTEND=noninteractive "$@"; }
fail() { echo "FAIL: $*" >&2; exit 1; }

echo "== apt-get install ./$(basename "$deb")"
in_root apt-get update -qq
in_root apt-get install -y -qq "/tmp/$(basename "$deb")" >/dev/null
in_root sh -c 'command -v g++ || command -v node' && fail "a compiler or Node.js came with the package"
mkdir -p "$root/home/player"

echo "== brimvault --version"
in_root brimvault --version | grep -q . || fail "--version printed nothing"

echo "== BrimvaultService --pack and -I"
mkdir -p "$root/home/player/Space Rocks"
printf 'MZ' > "$root/home/player/Space Rocks/Space Rocks.exe"
in_root BrimvaultService --pack "/home/player/Space Rocks" /home/player/rocks.bvxpak || fail "--pack"
in_root BrimvaultService -I /home/player/rocks.bvxpak || fail "-I"

echo "== brimvault --list --json"
in_root brimvault --list --json > "$root/tmp/list.json"
grep -q '"Space Rocks' "$root/tmp/list.json" || fail "--list --json does not show the installed game"

echo "== the desktop entry's command, under Xvfb"
in_root apt-get install -y -qq xvfb xauth >/dev/null
exec_line=$(sed -n 's/^Exec=//p' "$root/usr/share/applications/io.brimvault.Brimvault.desktop" | sed 's/ *%[a-zA-Z]//g')
in_root env BRIMVAULT_WINDOW_REPORT=/tmp/window.json QT_QPA_PLATFORM=xcb \
    timeout 120 xvfb-run -a $exec_line || fail "the window did not start and fill its list"
grep -q 'Space Rocks' "$root/tmp/window.json" || fail "the window does not show the installed game"

echo "== apt-get remove brimvault"
in_root dpkg -L brimvault > "$root/tmp/files.txt"
settings=$(cd "$root/home/player" && find . -type f -exec md5sum {} + | sort)
in_root apt-get remove -y -qq brimvault >/dev/null
while read -r path; do
    [ -d "$root$path" ] && continue
    [ -e "$root$path" ] || [ -L "$root$path" ] && fail "$path is left after remove"
done < "$root/tmp/files.txt"
[ -d "$root/usr/lib/brimvault" ] && fail "/usr/lib/brimvault is left after remove"
[ "$settings" = "$(cd "$root/home/player" && find . -type f -exec md5sum {} + | sort)" ] \
    || fail "remove changed the user's settings or games"
echo "package test passed"
