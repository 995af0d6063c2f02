# The tests source this file. It makes the folder $work, which is removed at the end.
work=$(mktemp -d) || exit 1
trap 'rm -rf "$work"' EXIT
trap 'exit 1' HUP INT TERM
# read_only [--bind FOLDER FOLDER]... -- COMMAND: of the host, COMMAND can only write to these folders.
read_only() { bwrap --die-with-parent --ro-bind / / --dev-bind /dev /dev "$@"; }
