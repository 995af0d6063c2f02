#!/bin/sh
# What the source package of folder $1 can do in a throw-away Debian: test the packages of that folder,
# which are installed there, and be built for another architecture, where a processor is emulated for
# the tests.
here=$(dirname "$(realpath "$0")")
. "$here/throw-away.sh"

must bare_debian "$root" debian-12-minbase
cp "$1"/* "$root/root"
must $container sh -c "$apt install autopkgtest && autopkgtest /root/*.changes -- null"
grep -m 1 '^journeys .*PASS' "$work/log"
must $container sh -c "dpkg --add-architecture arm64 && $apt install crossbuild-essential-arm64 &&
    $apt build-dep --host-architecture arm64 --build-profiles cross /root/*.dsc &&
    cd /root && dpkg-source -x *.dsc source &&
    cd source && dpkg-buildpackage --host-arch arm64 --build-profiles=cross --build=binary"
sed -n 's/^\(.* tests passed\)/arm64: \1/p' "$work/log"
