#!/bin/sh
# Runs the real panel-emulator ($1) on a small program that polls keys, and on what goes wrong.
emulator=$1 && work=$(mktemp -d) && cd "$work" && trap 'rm -r "$work"' EXIT || exit 1
check() { # STATUS:LINES-OF-COMPLAINT ARGUMENT...; the journey is on standard input
    want=$1 && shift && timeout 30 "$emulator" "$@" >out 2>err
    got=$?:$(wc -l <err)
    [ "$got" = "$want" ] || { echo "$*: $got, not $want" && cat out err && exit 1; }
}

cat >keys <<'END'
exec 3<>"$1" && stty min 0 time 5 <&3 && printf '\376\001%-16s' ready >&3
while printf '\376\000\376\006' >&3; do
    key=$(head -c 2 <&3 | od -An -tx1)
    held=$((${key:+held + 1} + 0)) && [ -z "$key" ] || printf '\376\002%s %-9s' "$key" $held >&3
done
END
printf '%s\n' 'expect ready ""' 'tap up 2' 'expect " fd be 1" ""' 'hold escape 3' release 'picture end' \
    'expect " fd b7 3" ""' 'run kill -0 $PANEL_COMMAND_PID && stty -F "$PANEL_TTY" ispeed 2400' |
    check 0:0 --journey - --pictures . --trace trace -- sh keys {tty} || exit 1
grep -q '> fd be' trace && grep -q '</svg>' end.svg && grep -qF '| fd b7 3' out || exit 1
echo 'expect other ""' | check 1:11 --limit 0.5 --journey - -- sleep 30 || exit 1
echo 'expect-cursor 0 0 on' | check 1:8 --limit 0.2 --journey - -- sleep 30 || exit 1
echo 'run exit 3' | check 1:1 --journey - -- sleep 30 || exit 1
echo 'wait 30' | tee journey | check 1:6 --journey - -- sh -c 'exit 150' || exit 1
check 2:1 --journey /none -- true && check 2:1 --none -- true && check 2:1 -- true </dev/null

# Killed, the emulator takes along its command and what that had started, even against SIGTERM.
"$emulator" --journey journey -- sh -c 'trap "" TERM; echo $$ >pid; sleep 30; sleep 30' &
until [ -s pid ]; do sleep 0.05; done && kill -9 $!
timeout 5 sh -c 'while kill -0 "-$(cat pid)" 2>/dev/null; do sleep 0.05; done'
