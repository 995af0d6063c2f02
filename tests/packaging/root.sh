#!/bin/sh
# Installs, runs, upgrades, removes and purges the packages in folder $1 in a throw-away Debian with a
# service manager of its own. What is not real there: the line is a pseudo-terminal, and its record
# among the devices is written by hand, on behalf of a terminal that the kernel has.
here=$(dirname "$(realpath "$0")")
. "$here/../box/expect.sh"
cached=${XDG_CACHE_HOME:-$HOME/.cache}/kestrova-panel/debian-12
work=$(mktemp -d)
root=$work/root
manager=
trap '[ -z "$manager" ] || kill -KILL "$(leader)"; wait; rm -rf "$work"' EXIT

cannot() { # said loudly; where CI runs it has to be possible
    echo "SKIPPED: THE PACKAGES WERE NOT INSTALLED ANYWHERE: $*" >&2
    [ "${CI-}" != true ] && exit 0
    exit 1
}
must() { "$@" >"$work/log" 2>&1 || { cat "$work/log"; echo "FAILED $*"; exit 1; }; }
export SYSTEMD_NSPAWN_UNIFIED_HIERARCHY=1 SYSTEMD_NSPAWN_API_VFS_WRITABLE=1
container="systemd-nspawn --quiet --register=no --keep-unit --console=pipe --directory=$root"
leader() { cut -d ' ' -f 1 "/proc/$manager/task/$manager/children"; }
inside() { nsenter --target "$(leader)" --all env -i PATH="$PATH" "$@"; }
await_boot() { # of a system whose first process is not $1
    tries=120
    until [ "$(leader)" != "$1" ] && [ "$(inside systemctl is-system-running 2>&1)" = running ]; do
        tries=$((tries - 1))
        [ $tries -gt 0 ] || must false "the system does not come up"
        sleep 0.5
    done
}
leftovers() {
    find "$root/etc" "$root/usr" "$root/var" -path '*/cache/apt' -prune -o \
        \( -name '*kestrova*' -o -name '*ttyS1*' -o -name 'panel-emulator*' \) -print
}

[ "$(id -u)" -eq 0 ] || cannot "root alone can"
[ -d "$cached" ] || {
    mkdir -p "${cached%/*}"
    debootstrap --variant=minbase --include=systemd-sysv,iproute2,ifupdown bookworm "$root" \
        >"$work/log" 2>&1 && mv "$root" "$cached" || { cat "$work/log"; cannot "debootstrap failed"; }
}
cp -a "$cached" "$root"
cp "$1"/*.deb "$here"/*.journey "$root/root"
dpkg-deb -R "$1"/kestrova-panel_*.deb "$work/upgrade"
sed -i '/^Version:/s/$/.1/' "$work/upgrade/DEBIAN/control"
must dpkg-deb -b "$work/upgrade" "$root/root/upgrade.deb"
sed -n '/^```sh$/,/^```$/p' "$here/../../docs/integration.md" | sed -n '/^#!/,/^```/{/^```/!p}' \
    >"$root/root/example"
chmod +x "$root/root/example"

# Where no service manager runs, as in an image's build.
apt='export DEBIAN_FRONTEND=noninteractive; apt-get -q update && apt-get -q -y --no-install-recommends'
must $container sh -c "$apt install /root/kestrova-panel_*.deb && dpkg --purge kestrova-panel"
expect "left after an installation without a service manager" "" "$(leftovers)"
must $container sh -c "$apt install /root/kestrova-*.deb"
expect "enabled" kestrova-panel.service "$(ls "$root/etc/systemd/system/dev-ttyS1.device.wants")"
cp -R "$root"/usr/share/kestrova-panel/box/appliance/etc "$root"/usr/share/kestrova-panel/box/appliance/opt "$root"
ln -s /dev/null "$root/etc/systemd/system/networking.service" # would not find its ports at boot

$container --boot --private-network --capability=CAP_NET_ADMIN,CAP_BPF --system-call-filter=bpf \
    </dev/null >"$work/boot" 2>&1 &
manager=$!
await_boot ""
must inside sh -ec '
    mkdir -p /run/udev/data /run/udev/tags/systemd
    printf "I:1\nE:SYSTEMD_ALIAS=/dev/ttyS1\nG:systemd\nQ:systemd\nV:1\n" >/run/udev/data/c4:60
    for port in eth0 eth1; do
        ip link add $port type veth peer name v-$port
        ip link set v-$port up
        ip link set $port up
    done
    ip addr add 192.0.2.10/24 dev eth0
    ip addr add 198.51.100.20/24 dev eth1
    ip addr add 198.51.100.1/24 dev v-eth1
    printf "%s\n" "interface v-eth1" "start 198.51.100.100" "end 198.51.100.100" \
        "option subnet 255.255.255.0" >/run/udhcpd.conf
    touch /var/lib/misc/udhcpd.leases
    udhcpd /run/udhcpd.conf'
play="panel-emulator --fast --trace /root/trace --journey"
must inside $play /root/service.journey -- sleep infinity
echo "first byte on the line after $((($(head -n 1 "$root/root/trace" | cut -d ' ' -f 1) / 1000 -
    $(cat "$root/root/started")) / 1000)) ms"
first=$(leader)
must inside systemd-run $play /root/hostname.journey -- sleep infinity
await_boot "$first"
expect "name after the reboot" rack12-monitor-westb "$(inside hostname)"

must inside dpkg --purge kestrova-panel kestrova-panel-tools
expect "left behind" "" "$(leftovers)"
exit $failed
