# expect TITLE WANTED GOT: says what differs and makes the script's `exit $failed` tell.
failed=0
expect() {
    [ "$2" = "$3" ] || { failed=1; printf 'FAILED %s\n  wanted: %s\n  got:    %s\n' "$@"; }
}
