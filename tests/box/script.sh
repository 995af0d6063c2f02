# Tests what the stand-in for the configuration script does to the appliance.
if [ ! -e /run/box/ready ]; then
    here=$(dirname "$(realpath "$0")")
    # The script is passed as text, because the box's root may be unable to reach this folder.
    exec "$here/../../box/kestrova-panel-box" --no-tty -- \
        sh -c "$(cat "$here/expect.sh" "$here/script.sh")"
fi
delivered=/run/box/appliance/etc
script=/opt/kestrova/scripts/ezio/apply.py

# Prints what the program would read: the script's output and then its status.
apply() { $script "$@" 2>/dev/null; echo $?; }
address() { ip -4 -o addr show dev "$1" | awk '{ print $4 }'; }

while read -r wanted arguments; do
    expect "$arguments" "$wanted" "$(eval "apply $arguments")"
done <<'TEXT'
2 iface --name eth9 --dhcp
2 iface --name bridge0 --dhcp
2 iface --name eth0 --dhcp --gateway 192.0.2.1
2 iface --name eth0 --ipaddress 192.0.2.9
2 iface --name eth0 --ipaddress 192.0.2.300 --netmask 255.255.255.0
2 iface --name eth0 --ipaddress 192.0.2.255 --netmask 255.255.255.0
2 iface --name eth0 --ipaddress 192.0.2.9 --netmask 255.0.255.0
2 iface --name eth0 --ipaddress 192.0.2.9 --netmask 0.0.0.255
2 iface --name eth0 --ipaddress 192.0.2.9 --netmask 255.255.255.0 --gateway 192.0.3.1
1 iface --name eth2 --dhcp
2 hostname --hostname under_score
2 hostname --hostname ends-
TEXT
expect "reasons logged" 11 "$(grep -c ' refused: ' ${script%.py}.log)"

set_eth0() {
    apply iface --name eth0 --ipaddress 192.0.2.77 --netmask 255.255.255.0 --gateway 192.0.2.254 "$@"
}
chmod a-w /etc/network
expect "unwritable" 1 "$(set_eth0 --dns 9.9.9.9)"
chmod u+w /etc/network
expect "files after failures" "" "$(for file in network/interfaces resolv.conf hostname; do
    diff $delivered/$file /etc/$file; done)"
expect "state after failures" "192.0.2.10/24 rack12-monitor-west" "$(address eth0) $(hostname)"

expect "static" 0 "$(set_eth0 --dns 9.9.9.9 --dns 1.1.1.1)"
expect "one stanza replaced" "" "$(sed 's/2\.10/2.77/; s/2\.1$/2.254/' \
    $delivered/network/interfaces | diff - /etc/network/interfaces)"
expect "servers" "search example.net nameserver 9.9.9.9 nameserver 1.1.1.1" \
    "$(xargs </etc/resolv.conf)"
expect "kernel" "192.0.2.77/24 default via 192.0.2.254 dev eth0" \
    "$(address eth0) $(ip route show default | xargs)"

# The program would read stanzas without an empty line between them as one.
printf 'iface eth1 inet static\n address 10.0.0.1\niface eth2 inet dhcp\n' >/etc/network/interfaces
expect "DHCP twice" "0 0" "$(apply iface --name eth1 --dhcp) $(apply iface --name eth1 --dhcp)"
expect "stanzas" "iface eth1 inet dhcp  iface eth2 inet dhcp " \
    "$(tr '\n' ' ' </etc/network/interfaces)"
expect "lease" "198.51.100.1xx/24 nameserver 198.51.100.1" \
    "$(address eth1 | sed 's/1[0-5][0-9]\//1xx\//') $(tail -n 1 /etc/resolv.conf)"
expect "DHCP clients" 1 "$(pidof udhcpc | wc -w)"
expect "back to static" 0 "$(apply iface --name eth1 --ipaddress 10.1.1.1 --netmask 255.0.0.0)"
expect "lease given up" "10.1.1.1/8 0" "$(address eth1) $(pidof udhcpc | wc -w)"

expect "a file that is missing" 1 "$(appliance has file /etc/none x 2>&1 | wc -l)"
echo chatters >/run/box/script-mode
expect "chatter" "Reloading the network configuration 0" "$(set_eth0 | xargs)"
echo hangs 60 >/run/box/script-mode
expect "hang" 124 "$(timeout 1 $script iface --name eth0 --dhcp; echo $?)"
finish
