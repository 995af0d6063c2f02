#!/bin/sh
# Installs, runs, upgrades, removes and purges the packages of folder $1 in a throw-away Debian with a
# service manager of its own, where those of folder $2 were installed first. What is not real there:
# the line is a pseudo-terminal, and its record among the devices is written by hand, as if it were a
# terminal of the kernel.
here=$(dirname "$(realpath "$0")")
. "$here/../box/expect.sh"
. "$here/throw-away.sh"
trap '[ -z "${manager-}" ] || kill -KILL "$(leader)" 2>/dev/null; wait; rm -rf "$work"' EXIT
leader() { cut -d " " -f 1 "/proc/$manager/task/$manager/children" 2>/dev/null; }
inside() { nsenter --target "$(leader)" --all env -i PATH=/usr/sbin:/usr/bin "$@"; }
boot() {
    $container --boot --private-network --capability=CAP_NET_ADMIN,CAP_BPF \
        --system-call-filter=bpf </dev/null >"$work/boot" 2>&1 &
    manager=$!
    for _ in $(seq 120); do
        [ "$(inside systemctl is-system-running 2>&1)" != running ] || return 0
        sleep 0.5
    done
    cat "$work/boot"
    give_up "to start the system"
}
leftovers() {
    find "$root/etc" "$root/usr" "$root/var" -path '*/cache/apt' -prune -o \
        \( -name '*kestrova*' -o -name '*ttyS1*' -o -name 'panel-emulator*' \) -print
}

must bare_debian "$root" debian-12 --include=systemd-sysv,iproute2,ifupdown
mkdir "$root/root/before"
cp "$2"/kestrova-panel_*.deb "$2"/kestrova-panel-tools_*.deb "$root/root/before"
cp "$1"/kestrova-panel_*.deb "$1"/kestrova-panel-tools_*.deb "$here/line" "$root/root"
dpkg-deb -R "$1"/kestrova-panel_*.deb "$work/upgrade"
sed -i '/^Version:/s/$/.1/' "$work/upgrade/DEBIAN/control"
must dpkg-deb -b "$work/upgrade" "$root/root/upgrade.deb"

# The two scripts, as delivered, and with a gate at the point where they have taken the port down or
# are about to change the name.
sed -n '/^#!/,/^```/{/^```/!p}' "$here/../../docs/integration.md" >"$root/root/example"
cp "$here/../../box/appliance/opt/kestrova/scripts/ezio/apply.py" "$root/root/stand-in"
gate=/opt/kestrova/gate
mkdir -p "$root$gate"
cp "$here/gate" "$root$gate"
sed "s|^ifup |$gate/gate wait; &|; s|^ *echo .*hostname.new|$gate/gate wait; &|; s/systemctl reboot/:/" \
    "$root/root/example" >"$root$gate/example"
sed "s|run(\"ifconfig\"|run(\"$gate/gate\", \"wait\"); &|; s|run(\"hostname\"|run(\"$gate/gate\", \"wait\"); &|
    s/run(\"reboot\")/pass/" "$root/root/stand-in" >"$root$gate/stand-in"
printf '#!/bin/sh\nexec %s/gate run "$@"\n' $gate >"$root$gate/apply.py"
chmod +x "$root/root/example" "$root/root/stand-in" "$root$gate"/*

# The program ends in every possible way, twice, so that each script sets a port and the name once.
interruptions() {
    while IFS='|' read -r title end back; do
        for scripts in example:stand-in stand-in:example; do
            sed "s|@TITLE@|$title|; s|@END@|$end|; s|@BACK@|$back|; s|@PORT_SCRIPT@|${scripts%:*}|
                s|@NAME_SCRIPT@|${scripts#*:}|" "$here/interrupted.journey"
        done
    done
}
{
    cat "$here/service.journey"
    interruptions <<'TEXT'
The service is restarted|systemctl restart kestrova-panel|true
The service is stopped|systemctl stop kestrova-panel|systemctl start kestrova-panel
The package is upgraded|dpkg -i /root/upgrade.deb|true
The package is removed|dpkg -r kestrova-panel|dpkg -i /root/upgrade.deb
The program crashes|pkill -SEGV -x kestrova-panel|true
The program is killed|pkill -KILL -x kestrova-panel|true
The panel is unplugged|/root/line unplug|/root/line plug
TEXT
    cat "$here/again.journey" "$here/reboot.journey"
} >"$root/root/all.journey"

# No service manager runs, as when an image is built.
must in_system "apt install /root/kestrova-panel_*.deb && dpkg --purge kestrova-panel"
expect "left after an installation without a service manager" "" "$(leftovers)"
must in_system "apt install /root/before/*.deb && apt install /root/kestrova-panel-tools_*.deb"
expect "enabled" kestrova-panel.service "$(ls "$root/etc/systemd/system/dev-ttyS1.device.wants")"

cp -R "$root"/usr/share/kestrova-panel/box/appliance/[eo]* "$root"
ln -s /dev/null "$root/etc/systemd/system/networking.service" # it would not find its ports at boot
boot
must inside sh -ec '
    mkdir -p /run/udev/data /run/udev/tags/systemd
    printf "I:1\nE:SYSTEMD_ALIAS=/dev/ttyS1\nG:systemd\nQ:systemd\nV:1\n" >/run/udev/data/c4:60
    for port in eth0 eth1; do
        ip link add $port up type veth peer name v-$port
        ip link set v-$port up
    done
    ip addr add 192.0.2.10/24 dev eth0
    ip addr add 198.51.100.20/24 dev eth1
    ip addr add 198.51.100.1/24 dev v-eth1
    printf "%s\n" "interface v-eth1" "start 198.51.100.100" "end 198.51.100.100" \
        "option subnet 255.255.255.0" >/run/udhcpd.conf
    touch /var/lib/misc/udhcpd.leases
    udhcpd /run/udhcpd.conf
    systemd-run sh -c "panel-emulator --fast --journey /root/all.journey \
        -- sleep infinity >/root/played 2>&1; systemctl poweroff"'
must timeout 900 tail -f --pid=$manager /dev/null
wait $manager
[ $? -eq 133 ] || { # the status after a reboot
    cat "$root/root/played"
    give_up "to come to the reboot"
}

boot
expect "name after the reboot" rack12-monitor-wesub "$(inside hostname)"
must inside dpkg --purge kestrova-panel kestrova-panel-tools
expect "left behind" "" "$(leftovers)"
finish
