# expect TITLE WANTED GOT: prints a difference, and makes the test's last command, `finish`, fail.
failed=0
expect() {
    [ "$2" = "$3" ] || { failed=1; printf 'FAILED %s\n  wanted: %s\n  got:    %s\n' "$@"; }
}
finish() { exit "$failed"; }
