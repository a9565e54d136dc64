#!/usr/bin/env bash
# Installs the built library into a scratch prefix and builds a program against it through
# pkg-config alone; the installed programs run from there without a library path. Usage: check.sh BUILD_DIR SOURCE_DIR [extra compiler flags...]
set -euo pipefail
build=$1 source=$2
shift 2
scratch=$(mktemp -d)
trap 'rm -rf "$scratch"' EXIT
cmake --install "$build" --prefix "$scratch/prefix" > /dev/null
pcdir=$(dirname "$(find "$scratch/prefix" -name vornnetwork.pc | head -n 1)")
flags=$(PKG_CONFIG_PATH=$pcdir pkg-config --cflags --libs vornnetwork)
# shellcheck disable=SC2086
c++ -std=c++17 "$@" "$source/tests/install/consumer.cpp" -o "$scratch/consumer" $flags
libdir=$(dirname "$(find "$scratch/prefix" -name 'libvornnetwork.so.5' | head -n 1)")
LD_LIBRARY_PATH=$libdir "$scratch/consumer" "$scratch/out.conf"
grep -q 'next=192.168.2.0' "$scratch/out.conf"
for program in sbin/vornnetd sbin/vornwifid sbin/vornnetdtool bin/vornwireless etc/rc.network; do
    "$scratch/prefix/$program" --help > /dev/null
done
