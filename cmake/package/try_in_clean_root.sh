#!/bin/sh
# Installs the packages in a bare Debian 12 of their own, uses each, removes them and looks for what they left behind. As
# root, with debootstrap and the package sources of this machine.
#   try_in_clean_root.sh PACKAGE.deb...
set -eu
[ $# -ge 1 ] || { sed -n '2,4p' "$0"; exit 2; }
root=$(mktemp -d /tmp/zelt-root.XXXXXX)
clean() {
    umount -l "$root/proc" "$root/dev" 2>/dev/null || true
    rm -rf --one-file-system "$root"
}
trap clean EXIT
mirror=$(grep -hoE '^(URIs:|deb) +.*' /etc/apt/sources.list /etc/apt/sources.list.d/* 2>/dev/null |
    grep -oE 'https?://[^ ]+' | grep -v security | head -1)
debootstrap --variant=minbase bookworm "$root" "$mirror" >"$root.log" 2>&1 || { tail -5 "$root.log"; exit 1; }
rm -f "$root.log" "$root/etc/apt/sources.list"
cp -a /etc/apt/sources.list.d /etc/apt/apt.conf.d "$root/etc/apt/"
[ ! -s /etc/apt/sources.list ] || cp /etc/apt/sources.list "$root/etc/apt/"
cp /etc/resolv.conf /etc/hosts "$root/etc/"
mount -t proc proc "$root/proc"
mount --bind /dev "$root/dev"
mkdir "$root/packages"
cp "$@" "$root/packages"
cp "$(dirname "$0")/../../tests/consumer/main.cpp" "$root/packages"

cat >"$root/packages/try" <<'END'
set -eu
export DEBIAN_FRONTEND=noninteractive LANG=C.UTF-8
quietly() { "$@" >/tmp/log 2>&1 || { cat /tmp/log; exit 1; }; }
quietly apt-get update
quietly apt-get install -y --no-install-recommends /packages/*.deb
echo "installed: $(dpkg-query -W -f '${Package} ' '*zelt*')"
cd /tmp
zelt --version
zelt call Basic.Add new:64x48:Unsigned:16 100 -o sum.tif
zelt stats sum.tif --json
/usr/bin/python3 -c '
import numpy, zelt
frame = numpy.asarray(zelt.imread("sum.tif"))
assert frame.shape == (48, 64) and (frame == 100).all()
assert zelt.create("ZELT.Main2").Statistics.Mean(frame[::-1, ::2]) == 100
print("python: works")'
[ -d /usr/lib/python3/dist-packages/zelt/__pycache__ ] # as Debian compiles its packages
zelt register
grep '^Path=' /usr/local/share/zelt/ZELT.module
zelt unregister
rmdir /usr/local/share/zelt
quietly apt-get install -y --no-install-recommends g++ pkg-config
g++ -std=c++20 /packages/main.cpp -o /tmp/consumer $(pkg-config --cflags --libs zelt)
/tmp/consumer
echo "development files: work"
quietly apt-get purge -y $(dpkg-query -W -f '${Package} ' '*zelt*')
left=$(find / -xdev -iname '*zelt*' -not -path '/proc/*' -not -path '/tmp/*' -not -path '/packages/*' -not -path '/var/log/*')
[ -z "$left" ] || { echo "left behind:" $left; exit 1; }
echo "removed without a trace"
END
chroot "$root" /usr/bin/env -i HOME=/root PATH=/usr/sbin:/usr/bin:/sbin:/bin /bin/sh /packages/try </dev/null
