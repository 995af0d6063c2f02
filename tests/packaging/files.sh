# Tests what an installation from build folder $1 for prefix $2 contains, and that it works in place.
. "$(dirname "$0")/../box/expect.sh"
. "$(dirname "$0")/../scratch.sh"
prefix=$work$2
unit=$prefix/lib/systemd/system/kestrova-panel.service

DESTDIR=$work read_only --bind "$work" "$work" --bind "$1" "$1" -- \
    cmake --install "$1" >/dev/null
expect "its path in the service" "$2/sbin/kestrova-panel" "$(sed -n 's/^ExecStart=.* //p' "$unit")"
expect "the service's faults" "" "$(systemd-analyze verify --man=no "$unit" 2>&1)"
expect "rights that the script is said not to have" "" \
    "$(grep -oE 'CAP_(SETUID|SETGID|KILL|SYS_CHROOT)' "$unit")"
systemd-analyze security --offline=true --threshold=50 "$unit" >"$work/exposure" 2>&1
expect "status at an exposure below 5.0" 0 $?

expect "faults of five manual pages" "5 " "$(find "$prefix/share/man" -type f | wc -l) $(
    mandoc -Tlint -W warning "$prefix"/share/man/man?/*)"

cd "$prefix/share/doc/kestrova-panel" || exit 1
expect "links of four guides to what is not installed" "4 " "$(find . -name '*.md' | wc -l) $(
    grep -oh ']([^)#]*' ./*.md | cut -c 3- | xargs -I '{}' sh -c '[ -e "{}" ] || echo "{}"')"
expect "versions of the tools" 1 "$(for tool in panel-emulator \
    kestrova-panel-box kestrova-appliance-check; do
    "$prefix/bin/$tool" --version | cut -d " " -f 2; done | uniq | wc -l)"

cd "$prefix/share/kestrova-panel" || exit 1
printf '%s\n' 'expect "Kestrova (TM)" "cabinetDevice"' \
    'run box/kestrova-panel-box --enter $PANEL_COMMAND_PID -- pidof kestrova-panel' |
    "$prefix/bin/panel-emulator" --fast --journey - -- \
        "$prefix/bin/kestrova-panel-box" -- "$prefix/sbin/kestrova-panel" >"$work/said" 2>&1
expect "status of the tools where they lie" 0 $?
[ $failed -eq 0 ] || cat "$work/exposure" "$work/said"
finish
