# What the box promises to who starts it, as this user and, for root, as an ordinary user too.
. "$(dirname "$0")/expect.sh"
unset PANEL_TTY
# The box is copied out: an ordinary user may not be able to reach the checkout.
copy=$(mktemp -d)
trap 'rm -rf "$copy"' EXIT
cp -R "$(dirname "$0")/../../box" "$1" "$copy"
chmod -R a+rX "$copy"
mkfifo "$copy/fifo"

box() { $user "$copy/box/kestrova-panel-box" "$@"; }
host_state() { hostname; ip -o link | cut -d: -f2; cat /etc/hostname /etc/resolv.conf; }

for user in "" "setpriv --reuid=65534 --regid=65534 --clear-groups"; do
    [ -z "$user" ] || [ "$(id -u)" -eq 0 ] || continue
    before=$(host_state)

    while read -r wanted arguments; do
        eval "box $arguments" >/dev/null 2>"$copy/said" </dev/null
        expect "status of: $arguments" "$wanted" "$?"
        [ "$wanted" -ne 2 ] || expect "lines for: $arguments" 1 "$(wc -l <"$copy/said")"
    done <<'TEXT'
2
2    --tty /dev/absent -- true
2    --no-tty true
2    --no-tty --appliance / -- true
2    --enter me -- true
125  --enter 99999999 -- true
127  --no-tty -- ./no-such-file
143  --no-tty -- sh -c 'kill $$'
150  --no-tty -- "$copy/kestrova-panel"
1    --no-tty -- touch /usr/x
1    --no-tty --script-fails -- /opt/kestrova/scripts/ezio/apply.py hostname --hostname a
TEXT

    expect "ports" "bridge0 eth0 eth1 eth2 eth5 " "$(box --no-tty -- ifconfig -s |
        awk 'NR > 1 && !/lo|v/ { printf "%s ", $1 }')"
    expect "port without address" "" "$(box --no-tty -- ifconfig eth2 | grep inet)"
    expect "first process" bwrap "$(box --no-tty -- ps -o comm= 1)"

    # The second run of the command sees the new name, and its end is the box's end.
    expect "runs" "rack12-monitor-west new 42 " "$({ box --no-tty -- sh -c '
        hostname
        [ $(hostname) != new ] || exit 42
        /opt/kestrova/scripts/ezio/apply.py hostname --hostname new &
        sleep 60'; echo $?; } | tr '\n' ' ')"

    # The pipe ends when the last process of the box that holds it is gone.
    $user "$copy/box/kestrova-panel-box" --no-tty -- sleep 1000 >"$copy/fifo" &
    outer=$!
    exec 3<"$copy/fifo"
    expect "entered" rack12-monitor-west "$(box --enter $outer -- hostname)"
    kill -9 $outer
    expect "all ended by a kill" "" "$(timeout 10 cat <&3 || echo no)"

    expect "host after all that" "$before" "$(host_state)"
done
exit $failed
