# read_only [--bind FOLDER FOLDER]... -- COMMAND: of the host, COMMAND can only write to these folders.
read_only() { bwrap --die-with-parent --ro-bind / / --dev-bind /dev /dev "$@"; }
