#!/bin/sh
# In a throw-away Debian, tests the installed packages of folder $1 with their source package, and builds
# that for another architecture, where the tests run on an emulated processor.
here=$(dirname "$(realpath "$0")")
. "$here/throw-away.sh"

must bare_debian "$root" debian-12-minbase
cp "$1"/* "$root/root"
must in_system "apt install autopkgtest && autopkgtest /root/*.changes -- null"
grep -m 1 '^journeys .*PASS' "$work/log"
must in_system "dpkg --add-architecture arm64 && apt install crossbuild-essential-arm64 &&
    apt build-dep --host-architecture arm64 --build-profiles cross /root/*.dsc &&
    cd /root && dpkg-source -x *.dsc source &&
    cd source && dpkg-buildpackage --host-arch arm64 --build-profiles=cross --build=binary"
sed -n 's/^\(.* tests passed\)/arm64: \1/p' "$work/log"
