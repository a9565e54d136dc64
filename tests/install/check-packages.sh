#!/usr/bin/env bash
# Unpacks the built packages into a scratch root and checks that the units, the D-Bus files, the
# library's links, the pkg-config file and the manual pages are where they belong.
# Usage: check-packages.sh DEB...
set -euo pipefail
root=$(mktemp -d)
trap 'rm -rf "$root"' EXIT
for deb in "$@"; do
    dpkg -x "$deb" "$root"
done
lib=/usr/lib/$(dpkg-architecture -qDEB_HOST_MULTIARCH)
for file in /lib/systemd/system/{vorn-bus,vornnetd,vornwifid}.service \
    /usr/share/dbus-1/services/com.tessarin.{net,wifi}.service /etc/rc.network \
    /usr/sbin/{vornnetd,vornwifid,vornnetdtool} /usr/bin/vornwireless \
    /usr/libexec/vornnetwork/{iwlist,stop} \
    "$lib/libvornnetwork.so.5.0.0" "$lib/pkgconfig/vornnetwork.pc" \
    /usr/include/vornnetwork/dbus/net_client.h \
    /usr/share/man/man8/{vornnetd,vornwifid,vornnetdtool}.8.gz /usr/share/man/man1/vornwireless.1.gz; do
    [ -e "$root$file" ] || { echo "check-packages: no $file" >&2; exit 1; }
done
[ "$(readlink "$root$lib/libvornnetwork.so.5")" = libvornnetwork.so.5.0.0 ]
[ "$(readlink "$root$lib/libvornnetwork.so")" = libvornnetwork.so.5 ]
grep -qx 'ExecStart=/usr/sbin/vornnetd --foreground' "$root/lib/systemd/system/vornnetd.service"
[ "$(realpath "$(PKG_CONFIG_PATH=$root$lib/pkgconfig pkg-config --variable=libdir vornnetwork)")" = "$root$lib" ]
echo "check-packages: the layout of $# packages is right"
