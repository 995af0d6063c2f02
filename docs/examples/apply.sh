#!/bin/sh
# An example for ifupdown, to be installed as /opt/kestrova/scripts/ezio/apply.py.
# Nothing reaches the panel but the status; neither from here nor from what ifup leaves running.
exec </dev/null >>/opt/kestrova/scripts/ezio/apply.log 2>&1
# One change at a time: the panel may start a second script while one is still at work.
[ "${KESTROVA_APPLY-}" = locked ] || exec env KESTROVA_APPLY=locked \
    flock --verbose --close --timeout 60 /run/kestrova-apply.lock "$0" "$@"
unset KESTROVA_APPLY
set -eu
echo "$(date): $*"

interfaces=/etc/network/interfaces
resolver=/etc/resolv.conf
hostname=/etc/hostname
saved='' port='' dhcp='' address='' netmask='' gateway='' servers='' name=''
octet='(25[0-5]|2[0-4][0-9]|1[0-9][0-9]|[1-9]?[0-9])'

refuse() {
    echo "refused: $*"
    exit 2
}

action=${1-}
[ $# -eq 0 ] || shift
while [ $# -gt 0 ]; do
    [ "$1" != --dhcp ] || { dhcp=yes; shift; continue; }
    # This keeps line feeds out of the files, and whatever a shell would evaluate.
    case ${2-} in '' | -* | *[!A-Za-z0-9.-]*) refuse "$1 ${2-}" ;; esac
    case $1 in
        --name) port=$2 ;;
        --hostname) name=$2 ;;
        --ipaddress | --netmask | --gateway | --dns)
            echo "$2" | grep -Eqx "$octet(\.$octet){3}" || refuse "$1 $2"
            case $1=$2 in
                --dns=*) servers="$servers $2" ;;
                --netmask=[1-9]*) netmask=$2 ;;
                # What is left of these is no address of a host.
                *=0.* | *=127.* | *=22[4-9].* | *=2[345]?.*) refuse "$1 $2" ;;
                --ipaddress=*) address=$2 ;;
                --gateway=*) gateway=$2 ;;
            esac ;;
        *) refuse "$1" ;;
    esac
    shift 2
done

# Whatever fails below ends the script (set -e), and the files are then as they were.
begin() {
    saved=$*
    trap put_back EXIT
    trap 'exit 1' INT TERM
    for file in $saved; do [ ! -e "$file" ] || cp -p "$file" "$file.before"; done
}
put_back() {
    for file in $saved; do
        rm -f "$file.new"
        [ ! -e "$file.before" ] || mv "$file.before" "$file"
    done
    [ -z "$port" ] || { ip -4 addr flush dev "$port" && ifup --force "$port"; }
}
finish() {
    trap - EXIT
    for file in $saved; do rm -f "$file.before"; done
}

case $action in
    hostname)
        case $name in '' | .* | *. | *..*) refuse "the name" ;; esac
        [ ${#name} -le 64 ] || refuse "the name is too long"
        begin $hostname
        echo "$name" >$hostname.new
        mv $hostname.new $hostname
        trap '' INT TERM # which come with the reboot
        systemctl reboot
        finish
        exit ;;
    iface)
        case $port in eth*) ip link show dev "$port" ;; *) refuse "the port" ;; esac
        case $dhcp:$address:$netmask in yes:: | :?*:?*) ;; *) refuse "neither DHCP nor an address" ;; esac ;;
    *) refuse "the action" ;;
esac

begin $interfaces $resolver
ifdown --force "$port" || true
ip -4 addr flush dev "$port"
{
    # The port's stanza stands first, because the panel would read one for IPv6 if that came before it.
    if [ -n "$address" ]; then
        printf 'iface %s inet static\n    address %s\n    netmask %s\n' "$port" "$address" "$netmask"
        [ -z "$gateway" ] || echo "    gateway $gateway"
    else
        echo "iface $port inet dhcp"
    fi
    echo
    # The other stanzas follow, each with the empty line that the panel takes for its end.
    awk -v port="$port" '
        $1 ~ /^(iface|mapping|auto|allow-.*|no-.*|source.*|rename|template)$/ {
            if (last != "") print last = ""
            own = $1 == "iface" && $2 == port && $3 == "inet"
        }
        $1 ~ /^(auto|allow-.*)$/ { for (i = 2; i <= NF; ++i) if ($i == port) automatic = 1 }
        !own || /^[ \t]*#/ { print; last = $0 }
        END {
            if (last != "") print ""
            if (!automatic) print "auto " port "\n"
        }' $interfaces
} >$interfaces.new
mv $interfaces.new $interfaces
ifup "$port"
# Not before ifup, because a DHCP client writes the servers of its lease.
if [ -n "$address$servers" ]; then
    grep -v '^nameserver' $resolver >$resolver.new || true
    for server in $servers; do echo "nameserver $server"; done >>$resolver.new
    mv $resolver.new $resolver
fi
finish
