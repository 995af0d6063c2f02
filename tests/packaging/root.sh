#!/bin/sh
# Installs, runs, upgrades and removes the packages of folder $2 in a throw-away Debian $1 with a service
# manager of its own. With a folder $3, that system then becomes a Debian 13 with the packages of that
# folder. What is not real there: the line is a pseudo-terminal, and its record among the devices is
# written by hand, as if it were a terminal of the kernel.
here=$(dirname "$(realpath "$0")")
release=$1
. "$here/throw-away.sh"
trap '[ -z "${manager-}" ] || kill -KILL "$(leader)" 2>/dev/null; wait; rm -rf "$work"' EXIT
leader() { cut -d " " -f 1 "/proc/$manager/task/$manager/children" 2>/dev/null; }
inside() { nsenter --target "$(leader)" --all env -i PATH=/usr/sbin:/usr/bin "$@"; }

# play JOURNEY: boots the system, which ends after the journey.
play() {
    $container --boot --private-network --capability=CAP_NET_ADMIN,CAP_BPF \
        --system-call-filter=bpf </dev/null >"$work/boot" 2>&1 &
    manager=$!
    tries=120
    until [ "$(inside systemctl is-system-running 2>&1)" = running ]; do
        [ $((tries -= 1)) -gt 0 ] || { cat "$work/boot"; give_up "to start the system"; }
        sleep 0.5
    done
    cp "$here/line" "$1" "$root/root"
    must inside sh -ec '
        mkdir -p /run/udev/data /run/udev/tags/systemd
        printf "I:1\nE:SYSTEMD_ALIAS=/dev/ttyS1\nG:systemd\nQ:systemd\nV:1\n" >/run/udev/data/c4:60
        for port in eth0 eth1; do
            ip link add $port up type veth peer name v-$port
            ip link set v-$port up
        done
        ip addr add 198.51.100.1/24 dev v-eth1
        printf "%s\n" "interface v-eth1" "start 198.51.100.100" "end 198.51.100.100" \
            "option subnet 255.255.255.0" >/run/udhcpd.conf
        touch /var/lib/misc/udhcpd.leases
        udhcpd /run/udhcpd.conf
        systemd-run sh -c "panel-emulator --fast --journey /root/${1##*/} \
            -- sleep infinity >/root/played 2>&1; systemctl poweroff"' sh "$1"
}
# A system that reboots ends with this status.
end_with_reboot() {
    timeout 900 tail -f --pid=$manager /dev/null || { cat "$root/root/played"; give_up "to end"; }
    wait $manager
    [ $? -eq 133 ] || { cat "$root/root/played"; give_up "to come to the reboot"; }
}
# After a reboot, the appliance is as the operator has set it.
come_back() {
    play "$here/rebooted.journey"
    timeout 120 cat "$root/root/there" || { cat "$root/root/played"; give_up "to come back"; }
}

cp "$2"/kestrova-panel_*.deb "$2"/kestrova-panel-tools_*.deb "$root/root"
mkfifo "$root/root/there"

# The two scripts, as delivered, and with a gate at the point where they have taken the port down or
# are about to change the name.
cp "$here/../../docs/examples/apply.sh" "$root/root/example"
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
{
    cat "$here/service.journey"
    while IFS='|' read -r title end back; do
        for scripts in example:stand-in stand-in:example; do
            sed "s|@TITLE@|$title|; s|@END@|$end|; s|@BACK@|$back|; s|@PORT_SCRIPT@|${scripts%:*}|
                s|@NAME_SCRIPT@|${scripts#*:}|" "$here/interrupted.journey"
        done
    done <<'TEXT'
The service is restarted|systemctl restart kestrova-panel|true
The service is stopped|systemctl stop kestrova-panel|systemctl start kestrova-panel
The package is installed again|dpkg -i /root/kestrova-panel_*|true
The package is removed|dpkg -r kestrova-panel \&\& ! pidof kestrova-panel|dpkg -i /root/kestrova-panel_*
The program crashes|pkill -SEGV -x kestrova-panel|true
The program is killed|pkill -KILL -x kestrova-panel|true
The panel is unplugged|/root/line unplug|/root/line plug
TEXT
    cat "$here/again.journey" "$here/reboot.journey"
} >"$work/all.journey"

must in_system "apt install systemd-sysv iproute2 ifupdown /root/*.deb"
cp -R "$root"/usr/share/kestrova-panel/box/appliance/[eo]* "$root"
ln -s /dev/null "$root/etc/systemd/system/networking.service" # it would not find its ports at boot
play "$work/all.journey"
end_with_reboot

[ -z "${3-}" ] || { # The packages are fetched now, because there is no network while the system runs.
    cp -R "$3" "$root/root/next"
    sed -i s/bookworm/trixie/ "$root/etc/apt/sources.list"
    must in_system "apt --download-only full-upgrade /root/next/*.deb"
}
come_back
[ -n "${3-}" ] || exit 0
must inside sh -ec '
    apt="env DEBIAN_FRONTEND=noninteractive apt-get -q -y --no-install-recommends"
    $apt -o Dpkg::Options::=--force-confold full-upgrade
    $apt install /root/next/*.deb
    systemctl is-active kestrova-panel && systemctl reboot'
end_with_reboot
come_back
