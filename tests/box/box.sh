# Tests what the box promises, as this user and, if that is root, as an ordinary user, too.
. "$(dirname "$0")/expect.sh"
unset PANEL_TTY
# The box is copied to where everyone may go, because the checkout may be out of reach for this user.
TMPDIR=/tmp . "$(dirname "$0")/../scratch.sh"
copy=$work
cp -R "$(dirname "$0")/../../box" "$1" "$copy"
cp -R "$copy/box/appliance" "$copy/broken"
chmod -R a+rwX "$copy"
mkfifo "$copy/fifo"
cd "$copy" || exit 1

box() { $user "$copy/box/kestrova-panel-box" "$@"; }
host_state() { hostname; ip -o link | cut -d: -f2; cat /etc/hostname /etc/resolv.conf; }
# A folder that this user may enter and the box's root may not, if there can be such a folder.
make_private() {
    rm -rf private
    mkdir private
    cp -R box kestrova-panel private
    [ "$(id -u)" -ne 0 ] || chown -R 65534 private
    chmod 700 private
}

for user in "" "setpriv --reuid=65534 --regid=65534 --clear-groups"; do
    [ -z "$user" ] || [ "$(id -u)" -eq 0 ] || continue
    before=$(host_state)
    make_private

    while read -r wanted arguments; do
        eval "$arguments" >/dev/null 2>said </dev/null
        expect "status of: $arguments" "$wanted" "$?"
        case $wanted in
            2 | 125 | 126 | 127) expect "lines for: $arguments" 1 "$(wc -l <said)" ;;
        esac
    done <<'TEXT'
2    box
2    box --tty /dev/absent -- true
2    box --no-tty true
2    box --no-tty --appliance / -- true
2    box --no-tty --script-hangs x -- true
2    box --enter me -- true
2    box --enter 1 --no-tty -- true
125  box --enter 99999999 -- true
125  box --no-tty -- true <&-
125  box --no-tty -- "$copy/box/kestrova-panel-box" --no-tty -- true
126  box --no-tty -- /tmp
127  box --no-tty -- ''
127  box --no-tty -- ./no-such-file
127  box --no-tty -- no-such-command
143  box --no-tty -- sh -c 'kill $$'
150  box --no-tty -- ./kestrova-panel
150  $user private/box/kestrova-panel-box --no-tty -- private/kestrova-panel
1    box --no-tty -- touch /usr/x
1    box --no-tty --script-fails -- /opt/kestrova/scripts/ezio/apply.py hostname --hostname a
TEXT

    # A fault in the appliance's files is reported before the box is made.
    while read -r file content; do
        cp -R "$copy"/box/appliance/. broken
        printf %b "$content" >"broken/$file"
        box --no-tty --appliance broken -- true >/dev/null 2>said
        expect "status of $file: $content" 125 "$?"
        expect "lines for $file: $content" 1 "$(grep -c "broken/$file" said)"
    done <<'TEXT'
links eth0\n
links eth0 - dhcp\n
links eth0 - dhcp 192.0.2.100/24
links eth0 - pppoe 192.0.2.1/24\n
links eth0 192.0.2.300/24\n
links eth0 192.0.2.1/33\n
links eth0 -\neth0 -
links lo -
links eth012345678ab -
links \0377 -
links bridge0 - dhcp 192.0.2.1/24
etc/hostname
etc/hostname two words\n
etc/hostname \0377
TEXT
    cp -R "$copy"/box/appliance/. broken
    printf '# no line feed at the end\neth0 -\neth9 -' >broken/links
    expect "last port without line feed" "eth0 eth9 lo v-eth0 v-eth9" "$(
        box --no-tty --appliance broken -- ifconfig -s | awk 'NR > 1 { print $1 }' | xargs)"
    (mkdir -p broken/etc/many && cd broken/etc/many && seq 2500 | xargs touch)
    expect "many files" 2500 "$(box --no-tty --appliance broken -- ls /etc/many | wc -l)"
    mkfifo broken/etc/fifo
    box --no-tty --appliance broken -- true 2>said
    expect "a pipe among the files" "125 1" "$? $(wc -l <said)"
    rm broken/etc/fifo

    # The limits are those of the surrounding namespace, not those of the host.
    for kind in user pid mnt net uts ipc; do
        $user unshare --user --map-root-user sh -c "echo 0 >/proc/sys/user/max_${kind}_namespaces
            exec box/kestrova-panel-box --no-tty -- true" 2>said
        expect "$kind namespaces refused" "125 1 user.max_${kind}_namespaces" \
            "$? $(wc -l <said) $(grep -o 'user.max_[a-z]*_namespaces' said)"
    done

    expect "ports" "bridge0 eth0 eth1 eth2 eth5 " "$(box --no-tty -- ifconfig -s |
        awk 'NR > 1 && !/lo|v/ { printf "%s ", $1 }')"
    expect "port without address" "" "$(box --no-tty -- ifconfig eth2 | grep inet)"
    expect "first process" bwrap "$(box --no-tty -- ps -o comm= 1)"

    # The second run of the command sees the new name, and when it ends, the box ends.
    expect "runs" "rack12-monitor-west new 42 " "$({ box --no-tty -- sh -c '
        hostname
        [ $(hostname) != new ] || exit 42
        /opt/kestrova/scripts/ezio/apply.py hostname --hostname new &
        sleep 60'; echo $?; } | tr '\n' ' ')"

    # The pipe ends when the last process that holds it has ended.
    $user "$copy/box/kestrova-panel-box" --no-tty -- sleep 1000 >fifo &
    outer=$!
    exec 3<fifo
    expect "entered" rack12-monitor-west "$(box --enter $outer -- hostname)"
    kill -9 $outer
    expect "all ended by a kill" "" "$(timeout 10 cat <&3 || echo no)"
    exec 3<>fifo
    for delay in $(seq 0 3 96); do
        $user "$copy/box/kestrova-panel-box" --no-tty -- sleep 1000 >fifo 2>/dev/null &
        sleep "0.0$(printf %02d "$delay")"
        kill -9 $!
    done
    exec 4<fifo 3<&-
    expect "all ended by early kills" "" "$(timeout 10 cat <&4 || echo no)"
    exec 4<&-

    expect "host after all that" "$before" "$(host_state)"
done
finish
