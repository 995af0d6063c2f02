# read_only FOLDER... -- COMMAND: with nothing of the host writable but these folders.
read_only() {
    writable=
    for place; do
        shift
        [ "$place" != -- ] || break
        writable="$writable --bind $place $place"
    done
    bwrap --die-with-parent --ro-bind / / --dev-bind /dev /dev $writable -- "$@"
}
