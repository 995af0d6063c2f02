#!/bin/sh
# In a throw-away Debian $1, tests the installed packages of folder $2 with their source package. On this
# machine's release, builds that for another architecture and tests it on an emulated processor.
here=$(dirname "$(realpath "$0")")
release=$1
. "$here/throw-away.sh"

cp "$2"/* "$root/root"
must in_system "apt install autopkgtest && autopkgtest /root/*.changes -- null"
grep '^[a-z-]* *PASS' "$work/log"
is_own "$release" || exit 0
must in_system "dpkg --add-architecture arm64 && apt install crossbuild-essential-arm64 &&
    apt build-dep --host-architecture arm64 --build-profiles cross /root/*.dsc &&
    cd /root && dpkg-source -x *.dsc source &&
    cd source && dpkg-buildpackage --host-arch arm64 --build-profiles=cross --build=binary"
sed -n 's/^\(.* tests passed\)/arm64: \1/p' "$work/log"
