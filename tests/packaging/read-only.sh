# read_only FOLDER... -- COMMAND: runs COMMAND with only these folders of the host writable.
read_only() {
    writable=
    for place; do
        shift
        [ "$place" != -- ] || break
        writable="$writable --bind $place $place"
    done
    bwrap --die-with-parent --ro-bind / / --dev-bind /dev /dev $writable -- "$@"
}
